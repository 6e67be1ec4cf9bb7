#include "platform/linux/archive/archive_output.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr std::size_t kBufferSize = 256U << 10U;
/// The disk is kept busy while the next part is compressed: the sync at the end is short then.
constexpr std::uint64_t kWriteAhead = 4U << 20U;
constexpr mode_t kMode = S_IRUSR | S_IWUSR | S_IRGRP;

}  // namespace

ArchiveOutput::ArchiveOutput(const std::string& path)
    : _file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, kMode)),
      _made(_file.isOpen()),
      _buffer(std::make_unique<char[]>(kBufferSize)) {
  struct stat status {};
  if (!_file.isOpen() || ::fstat(_file.get(), &status) != 0) _error = lastSystemError();
  // Until it is closed it is nobody's leftover.
  if (_file.isOpen()) static_cast<void>(::flock(_file.get(), LOCK_EX | LOCK_NB));
  _device = status.st_dev;
  _inode = status.st_ino;
}

void ArchiveOutput::write(const char* bytes, std::size_t size) {
  const std::size_t patch =
      _position < _flushed ? static_cast<std::size_t>(std::min<std::uint64_t>(size, _flushed - _position))
                           : 0;
  if (patch > 0) {
    _writeAt(_position, bytes, patch);
    _position += patch;
    bytes += patch;
    size -= patch;
  }
  while (size > 0) {
    const auto at = static_cast<std::size_t>(_position - _flushed);
    const std::size_t part = std::min(size, kBufferSize - at);
    std::memcpy(_buffer.get() + at, bytes, part);
    _buffered = std::max(_buffered, at + part);
    _position += part;
    bytes += part;
    size -= part;
    if (_buffered == kBufferSize) _flush();
  }
}

void ArchiveOutput::_flush() {
  _writeAt(_flushed, _buffer.get(), _buffered);
  _flushed += _buffered;
  _buffered = 0;
  if (_flushed - _onItsWay < kWriteAhead || _error) return;
  // Some file systems cannot; the sync at the end has the last word.
  ::sync_file_range(_file.get(), static_cast<off_t>(_onItsWay), static_cast<off_t>(_flushed - _onItsWay),
                    SYNC_FILE_RANGE_WRITE);
  _onItsWay = _flushed;
}

void ArchiveOutput::_writeAt(std::uint64_t position, const char* bytes, std::size_t size) {
  while (size > 0 && !_error) {
    const ssize_t written = ::pwrite(_file.get(), bytes, size, static_cast<off_t>(position));
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) {
      _error = written < 0 ? lastSystemError() : std::make_error_code(std::errc::io_error);
      return;
    }
    bytes += written;
    position += static_cast<std::uint64_t>(written);
    size -= static_cast<std::size_t>(written);
  }
}

void ArchiveOutput::sync() {
  _flush();
  if (!_error && ::fsync(_file.get()) != 0) _error = lastSystemError();
  if (!_error) ::posix_fadvise(_file.get(), 0, 0, POSIX_FADV_DONTNEED);
  if (_file.isOpen() && ::close(_file.release()) != 0 && !_error) _error = lastSystemError();
}

}  // namespace zal
