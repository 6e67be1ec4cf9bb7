#include "platform/linux/progress/runtime_dump_progress.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <filesystem>
#include <utility>

#include "platform/linux/files/system_error.h"
#include "platform/linux/files/unix_milliseconds.h"
#include "platform/linux/files/whole_file.h"
#include "platform/linux/notifications/notification_file.h"
#include "platform/linux/progress/progress_file.h"

namespace zal {
namespace {

constexpr std::size_t kMostRecords = 20;
// Readers take files of up to 1 MiB. What is missing may be many thousands of files.
constexpr std::size_t kMostBytesWithMissing = std::size_t{512} << 10U;

/// One record being written. The file holds whole lines only: what a full disk cut short is taken back.
class ProgressFile : public DumpProgress {
 public:
  ProgressFile(const Clock& clock, AgentLog& log, std::string path)
      : _clock(clock), _log(log), _path(std::move(path)) {}
  ~ProgressFile() override {
    _end(progressCutOffText(_clock.wallNow()));
    if (_descriptor >= 0) ::close(_descriptor);
  }
  ProgressFile(const ProgressFile&) = delete;
  ProgressFile& operator=(const ProgressFile&) = delete;

  void open(const std::string& text) {
    _descriptor =
        ::open(_path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_APPEND | O_NOFOLLOW | O_CLOEXEC, 0600);
    if (_descriptor < 0) {
      _complain(lastSystemError());
      return;
    }
    _append(text);
  }

  void step(std::size_t number) override {
    const std::lock_guard lock(_mutex);
    if (!_ended) _append(progressStepText(number, _clock.wallNow()));
  }
  void missing(std::string_view what, std::string_view why) override {
    const std::lock_guard lock(_mutex);
    if (_ended || _isFull) return;
    _isFull = _length > kMostBytesWithMissing;
    _append(_isFull ? progressMissingText("more", "the list is longer than this record takes")
                    : progressMissingText(what, why));
  }
  void done(const std::string& archivePath) override {
    _end(progressDoneText(archivePath, _clock.wallNow()));
  }
  void failed(std::string_view reason) override { _end(progressFailedText(reason, _clock.wallNow())); }

 private:
  void _end(const std::string& line) {
    const std::lock_guard lock(_mutex);
    if (!std::exchange(_ended, true)) _append(line);
  }
  void _append(const std::string& text) {
    if (_descriptor < 0) return;
    if (const std::error_code error = writeWhole(_descriptor, text)) {
      _complain(error);
      if (::ftruncate(_descriptor, static_cast<off_t>(_length)) != 0) _complain(lastSystemError());
      return;
    }
    _length += text.size();
  }
  void _complain(const std::error_code& error) {
    if (std::exchange(_complained, true)) return;
    _log.warning(_path + ": cannot be written: " + error.message());
  }

  const Clock& _clock;
  AgentLog& _log;
  const std::string _path;
  std::mutex _mutex;
  // Guarded by _mutex from here on.
  int _descriptor = -1;
  std::size_t _length = 0;
  bool _ended = false, _isFull = false, _complained = false;
};

}  // namespace

RuntimeDumpProgress::RuntimeDumpProgress(const Clock& clock, AgentLog& log, std::string directory)
    : _clock(clock), _log(log), _directory(std::move(directory)) {}

std::shared_ptr<DumpProgress> RuntimeDumpProgress::begin(DumpPlan plan) {
  const std::lock_guard lock(_mutex);
  const WallTime now = _clock.wallNow();
  const ProcessIdentity agent = ProcessIdentity::ofThisProcess();
  auto file = std::make_shared<ProgressFile>(_clock, _log, _nextPath(now, agent));
  // Where the directory cannot be made, the file's own failure says why.
  (void)makeNotificationDirectory(_directory);
  file->open(progressBeginText(plan.service, plan.directory, plan.steps, now, agent));
  _prune();
  return file;
}

std::vector<CutOffDump> RuntimeDumpProgress::cutOff() {
  std::vector<CutOffDump> found;
  for (ListedDumpProgress& listed : listDumpProgress(_directory)) {
    DumpProgressRecord& record = listed.record;
    if (record.state != DumpProgressRecord::State::cutOff) continue;
    CutOffDump dump{std::move(record.service), std::move(record.directory), {}};
    for (DumpProgressRecord::Step& step : record.steps) {
      dump.steps.push_back({std::move(step.name), step.began.has_value()});
    }
    found.push_back(std::move(dump));
  }
  return found;
}

/// The names sort by time, and within a millisecond by the order of one process.
std::string RuntimeDumpProgress::_nextPath(WallTime now, const ProcessIdentity& agent) {
  std::array<char, 64> name{};
  std::snprintf(name.data(), name.size(), "/%013lld-%06u-%d.progress",
                static_cast<long long>(unixMilliseconds(now)), ++_counter % 1'000'000U, agent.processId);
  return _directory + name.data();
}

void RuntimeDumpProgress::_prune() const {
  const auto names = dumpProgressNames(_directory);
  for (std::size_t i = 0; i + kMostRecords < names.size(); ++i) {
    const auto record = readDumpProgress(_directory, names[i]);
    if (record && record->state == DumpProgressRecord::State::running) continue;
    std::error_code ignored;  // another agent may have been faster
    std::filesystem::remove(_directory + "/" + names[i], ignored);
  }
}

}  // namespace zal
