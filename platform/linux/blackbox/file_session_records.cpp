#include "platform/linux/blackbox/file_session_records.h"

#include <unistd.h>

#include <exception>
#include <system_error>
#include <utility>

#include "platform/linux/blackbox/left_record.h"
#include "platform/linux/files/directory_names.h"

namespace zal {
namespace {

std::vector<std::string> leftIn(const std::string& directory, AgentLog& log) {
  std::error_code error;
  std::vector<std::string> names = namesIn(directory, error);
  if (error && error != std::errc::no_such_file_or_directory) {
    log.warning("The black box cannot be read: " + directory + ": " + error.message());
  }
  return names;
}

}  // namespace

FileSessionRecords::FileSessionRecords(RunLoop& loop, AgentLog& log, std::string directory,
                                       const BlackBoxSettings& settings)
    : _log(log), _directory(std::move(directory)), _settings(settings) {
  loop.addSleepObserver([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _write();
  });
}

std::shared_ptr<SessionRecord> FileSessionRecords::begin() {
  if (!_settings.enabled) return nullptr;
  try {
    auto file = std::make_shared<RecordFile>(_log, _directory, _settings.sync);
    _open.push_back(file);
    return file;
  } catch (const std::exception& exception) {
    _log.warning(std::string("A session goes on without the black box: ") + exception.what());
    return nullptr;
  }
}

void FileSessionRecords::_write() {
  std::erase_if(_open, [](const std::weak_ptr<RecordFile>& record) {
    const auto file = record.lock();
    if (file) file->write();
    return !file;
  });
}

void FileSessionRecords::flush() {
  _write();
  if (!_settings.sync) return;
  for (const auto& record : _open) {
    if (const auto file = record.lock()) file->sync();
  }
}

void FileSessionRecords::recover(const std::function<bool(const UnfinishedRecord& record)>& handler) {
  for (const std::string& name : leftIn(_directory, _log)) {
    const auto left = LeftRecord::take(_directory, name, _log);
    if (!left) continue;
    try {
      if (handler(*left)) {
        if (_settings.sync) ::sync();  // what came of it, wherever that lies
        left->remove();
      } else {
        left->putBack();
      }
    } catch (const std::exception& exception) {
      _log.warning("A session could not be recovered from " + _directory + "/" + name + ": " +
                   exception.what());
    }
  }
}

}  // namespace zal
