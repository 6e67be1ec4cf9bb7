#include "platform/linux/blackbox/record_file.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <filesystem>
#include <memory>
#include <system_error>
#include <utility>

#include "platform/linux/blackbox/record_frame.h"
#include "platform/linux/files/file_copy.h"
#include "platform/linux/files/private_directory.h"
#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

/// Beyond it a write costs hardly less per byte; below it the memory is reused from write to write.
constexpr std::size_t kWriteSize = 64U << 10U;
/// Room for the last minutes of a call on a disk that fills up meanwhile.
constexpr std::uint64_t kReserve = 512U << 10U;
/// What waits in memory for a disk that refuses.
constexpr std::size_t kMostPending = 1U << 20U;

std::error_code syncFile(const Descriptor& file) {
  while (::fdatasync(file.get()) != 0) {
    if (errno != EINTR) return lastSystemError();
  }
  return {};
}

std::string parentOf(const std::string& path) { return path.substr(0, path.rfind('/')); }

/// The first trouble; the others are synced all the same.
std::error_code syncFilesIn(const std::string& directory) {
  std::error_code error, trouble;
  for (const auto& entry : std::filesystem::directory_iterator(directory, error)) {
    if (!entry.is_regular_file(error)) continue;
    const Descriptor file(::open(entry.path().c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    error = file.isOpen() ? syncFile(file) : lastSystemError();
    if (!trouble) trouble = error;
  }
  for (const std::string& place : {directory, parentOf(directory)}) {
    error = syncDirectory(place);
    if (!trouble) trouble = error;
  }
  return trouble;
}

void tellUnsynced(AgentLog& log, const std::string& path, const std::error_code& error) {
  log.warning("What a session accepted may not outlive the end of the power: " + path + ": " +
              error.message());
}

}  // namespace

std::uint32_t recordSeed(std::string_view fileName) {
  constexpr std::size_t kDigits = 8;
  std::uint32_t seed = 0;
  const std::string_view digits = fileName.substr(0, kDigits);
  std::from_chars(digits.data(), digits.data() + digits.size(), seed, 16);
  return seed;
}

RecordFile::RecordFile(AgentLog& log, std::string directory, bool syncs)
    : _log(log),
      _directory(std::move(directory)),
      _path(_directory + "/" + randomName().append(kRecordFileEnding)),
      _seed(recordSeed(std::string_view(_path).substr(_directory.size() + 1))),
      _syncs(syncs) {}

RecordFile::~RecordFile() { write(); }

void RecordFile::append(std::string_view piece) {
  if (_removed) return;
  appendRecordFrame(_pending, _seed, piece);
  if (_pending.size() >= kWriteSize) write();
}

void RecordFile::write() {
  if (_pending.empty() || !_open()) return;
  _reserve(_pending.size());
  std::size_t done = 0;
  while (done < _pending.size()) {
    const ssize_t count = ::write(_file.get(), _pending.data() + done, _pending.size() - done);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) break;
    done += static_cast<std::size_t>(count);
  }
  _written += done;
  if (done < _pending.size()) {
    const int error = errno;
    _pending.erase(0, done);
    return _refuse(error);
  }
  if (std::exchange(_refused, false)) _log.notice("The black box takes entries of sessions again");
  _pending.clear();
  if (_pending.capacity() > 2 * kWriteSize) std::string().swap(_pending);
}

bool RecordFile::_open() {
  if (_file.isOpen()) return true;
  if (!ensurePrivateDirectory(_directory)) {
    _refuse(errno != 0 ? errno : EACCES);
    return false;
  }
  _file = Descriptor(::open(_path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_APPEND | O_NOFOLLOW | O_CLOEXEC,
                            S_IRUSR | S_IWUSR));
  if (!_file.isOpen()) {
    _refuse(errno);
    return false;
  }
  // Another agent of this user must not take a living session's record for one that was left.
  static_cast<void>(::flock(_file.get(), LOCK_EX | LOCK_NB));
  return true;
}

void RecordFile::_reserve(std::size_t more) {
  const std::uint64_t needed = _written + more;
  if (needed + kReserve / 2 <= _reserved) return;
  const std::uint64_t end = needed + kReserve;
  // The size stays that of what is written. Where there is no room, or no such call, the write will tell.
  if (::fallocate(_file.get(), FALLOC_FL_KEEP_SIZE, static_cast<off_t>(_reserved),
                  static_cast<off_t>(end - _reserved)) == 0) {
    _reserved = end;
  }
}

void RecordFile::_refuse(int error) {
  if (!std::exchange(_refused, true)) {
    _log.warning("The black box takes no entries of a session: " + _path + ": " +
                 std::generic_category().message(error) + "; sessions go on without it");
  }
  if (_pending.size() > kMostPending) std::string().swap(_pending);
}

void RecordFile::sync() {
  if (!_syncs || !_file.isOpen() || _written == _synced) return;
  std::error_code error = syncFile(_file);
  // Its name is there from then on as well, and that of the directory, which may be as new.
  if (!error && _synced == 0) error = syncDirectory(_directory);
  if (!error && _synced == 0) error = syncDirectory(parentOf(_directory));
  if (!error) _synced = _written;
  if (!std::exchange(_isUnsyncedTold, static_cast<bool>(error)) && error) tellUnsynced(_log, _path, error);
}

std::function<void()> RecordFile::removal(const std::string& writtenInto) {
  _removed = true;
  std::string().swap(_pending);
  if (!_file.isOpen()) return [] {};
  // With its lock, which another start of the agent respects.
  return [&log = _log, path = _path, file = std::make_shared<Descriptor>(std::move(_file)),
          toSync = _syncs ? writtenInto : std::string()] {
    if (!toSync.empty()) {
      if (const std::error_code error = syncFilesIn(toSync)) tellUnsynced(log, toSync, error);
    }
    ::unlink(path.c_str());
    *file = {};
  };
}

}  // namespace zal
