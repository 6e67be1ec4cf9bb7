#include "session/buffered_file.h"

#include <cerrno>
#include <cstring>

#include <utility>

#include "platform/file_placement.h"

namespace zal {

namespace {
// Small pieces are gathered: few writes matter more than the memory of one buffer.
constexpr std::size_t kBufferSize = 256U * 1024U;
// Larger ones go to the system as they are, for gathering them would only copy them once more.
constexpr std::size_t kLargePiece = 64U * 1024U;
}  // namespace

BufferedFile::BufferedFile(FilePlacement& files, const std::string& path) : _file(files.openFresh(path)) {
  if (_file == nullptr) {
    _error = errno;
    return;
  }
  std::setvbuf(_file, nullptr, _IONBF, 0);
  _buffer = std::make_unique_for_overwrite<char[]>(kBufferSize);
}

void BufferedFile::append(std::string_view bytes) {
  if (failed() || bytes.empty()) return;
  if (bytes.size() > kBufferSize - _used) _flush();
  if (bytes.size() >= kLargePiece) {
    _flush();
    _write(bytes);
    return;
  }
  std::memcpy(_buffer.get() + _used, bytes.data(), bytes.size());
  _used += bytes.size();
}

int BufferedFile::close() {
  if (_file == nullptr) return _error;
  _flush();
  if (std::fclose(std::exchange(_file, nullptr)) != 0) _note();
  return _error;
}

void BufferedFile::_flush() {
  _write({_buffer.get(), _used});
  _used = 0;
}

void BufferedFile::_write(std::string_view bytes) {
  if (failed() || bytes.empty()) return;
  if (std::fwrite(bytes.data(), 1, bytes.size(), _file) != bytes.size()) _note();
}

void BufferedFile::_note() {
  if (_error == 0) _error = errno != 0 ? errno : EIO;
}

}  // namespace zal
