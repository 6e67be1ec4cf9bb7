#include "platform/linux/log/rotating_log_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <system_error>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/log/log_set_directory.h"
#include "platform/linux/log/record_text.h"
#include "platform/linux/log/rotation_names.h"

namespace zal {
namespace {

constexpr mode_t kFileMode = 0640;
constexpr mode_t kLogDirectoryMode = 0770;

bool makeDirectories(const std::string& path) {
  if (::mkdir(path.c_str(), kLogDirectoryMode) == 0 || errno == EEXIST) return true;
  const std::size_t slash = path.rfind('/');
  if (errno != ENOENT || slash == std::string::npos || slash == 0) return false;
  return makeDirectories(path.substr(0, slash)) &&
         (::mkdir(path.c_str(), kLogDirectoryMode) == 0 || errno == EEXIST);
}

int openForAppending(int directory, const std::string& name) {
  // Not blocking: a pipe in the file's place must not stop the agent. Regular files do not care.
  return ::openat(directory, name.c_str(),
                  O_RDWR | O_CREAT | O_APPEND | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, kFileMode);
}

std::string errorText(int error) { return std::generic_category().message(error); }

}  // namespace

RotatingLogFile::RotatingLogFile(Place place, std::uint64_t rotationSize, std::vector<std::string>& messages)
    : _place(std::move(place)),
      _rotationSize(rotationSize),
      _rotationLimit(rotationSize),
      _messages(messages) {
  if (!_open()) _beginOutage(errno);
}

RotatingLogFile::~RotatingLogFile() { close(); }

std::string& RotatingLogFile::beginRecord() {
  _recordStart = _buffer.size();
  return _buffer;
}

void RotatingLogFile::endRecord() {
  if (!_inOutage || _recordStart < kLargestBacklog) return;
  _buffer.resize(_recordStart);
  ++_dropped;
}

bool RotatingLogFile::flush() {
  if (_buffer.empty() && !_inOutage) return true;
  if (_inOutage) leaveIfReplaced();
  const int error = _descriptor >= 0 || _open() ? _write() : errno;
  if (error == 0) {
    if (_inOutage) _endOutage();
    return true;
  }
  _beginOutage(error);
  return false;
}

/// Returned: 0 once everything is written, else what stopped it.
int RotatingLogFile::_write() {
  std::size_t written = 0;
  int error = 0;
  while (written < _buffer.size()) {
    const ssize_t count = ::write(_descriptor, _buffer.data() + written, _buffer.size() - written);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) {
      error = count < 0 ? errno : EIO;
      break;
    }
    written += static_cast<std::size_t>(count);
  }
  _size += written;
  if (written == _buffer.size()) {
    _buffer.clear();
    _startsInsideRecord = false;
  } else if (written > 0) {
    _startsInsideRecord = _buffer[written - 1] != '\n' ||
                          std::string_view(_buffer).substr(written).starts_with(kContinuationMark);
    _buffer.erase(0, written);
  }
  return error;
}

bool RotatingLogFile::_open() {
  Descriptor directory = openLogSet(_place.root, _place.directory);
  if (!directory.isOpen() && errno == ENOENT && makeDirectories(_directoryPath()))
    directory = openLogSet(_place.root, _place.directory);
  if (directory.isOpen()) _descriptor = openForAppending(directory.get(), _place.fileName);
  if (_descriptor < 0) return false;
  struct stat status {};
  _size = ::fstat(_descriptor, &status) == 0 ? static_cast<std::uint64_t>(status.st_size) : 0;
  if (!_startsInsideRecord) {
    _endTornLine();
  } else if (_size == 0) {
    _forgetTornRecord();
  }
  return true;
}

/// An agent that was killed inside a write leaves a line without its end. What comes next must not
/// be taken for the rest of it.
void RotatingLogFile::_endTornLine() {
  char last = '\n';
  if (_size == 0 || ::pread(_descriptor, &last, 1, static_cast<off_t>(_size - 1)) != 1) return;
  if (last != '\n' && ::write(_descriptor, "\n", 1) == 1) ++_size;
}

/// The file with the first part of the record is gone; the rest alone would pass for another record.
void RotatingLogFile::_forgetTornRecord() {
  _buffer.erase(0, nextRecordStart(_buffer, 0));
  _startsInsideRecord = false;
  ++_dropped;
}

void RotatingLogFile::leaveIfReplaced() {
  if (_descriptor >= 0 && _wasReplaced()) close();
}

/// Whether somebody took the file away or put another one in its place: what is written to the open
/// one would be seen by nobody.
bool RotatingLogFile::_wasReplaced() const {
  struct stat open {};
  struct stat named {};
  if (::fstat(_descriptor, &open) != 0) return false;
  return ::lstat(path().c_str(), &named) != 0 || named.st_ino != open.st_ino || named.st_dev != open.st_dev;
}

std::error_code RotatingLogFile::_renameAway(std::uint64_t& sequence) const {
  const Descriptor directory = openLogSet(_place.root, _place.directory);
  if (!directory.isOpen()) return lastSystemError();
  for (;; ++sequence) {
    // A second agent may have taken the number; nothing that waits may be overwritten.
    const std::error_code error = renameNoReplaceAt(directory.get(), _place.fileName, directory.get(),
                                                    pendingName(_place.fileName, sequence));
    if (error != std::errc::file_exists) return error;
  }
}

bool RotatingLogFile::rotateAway(std::uint64_t& sequence) {
  const std::error_code error = _renameAway(sequence);
  if (!error) {
    close();
    _rotationLimit = _rotationSize;
    _rotationFailed = false;
    if (!_open()) _beginOutage(errno);
    return true;
  }
  if (!_rotationFailed) _messages.push_back(path() + ": cannot be rotated: " + error.message());
  _rotationFailed = true;
  _rotationLimit = _size + _rotationSize;
  return false;
}

void RotatingLogFile::close() {
  if (_descriptor >= 0) ::close(_descriptor);
  _descriptor = -1;
}

void RotatingLogFile::_beginOutage(int error) {
  if (!_inOutage) {
    _messages.push_back(path() + ": cannot be written: " + errorText(error) +
                        "; up to 4 MiB of records are kept until it can");
  }
  _inOutage = true;
  if (_buffer.size() <= kLargestBacklog) return;
  const std::size_t end = nextRecordStart(_buffer, kLargestBacklog - 1);
  _dropped += countRecords(std::string_view(_buffer).substr(end));
  _buffer.resize(end);
}

void RotatingLogFile::_endOutage() {
  _messages.push_back(path() + ": is written again; " + std::to_string(_dropped) + " records were dropped");
  _inOutage = false;
  _dropped = 0;
}

}  // namespace zal
