#include "session/line_file.h"

#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>

#include <algorithm>
#include <memory>
#include <system_error>
#include <utility>

#include "platform/fresh_file.h"
#include "session/fetch_soon.h"
#include "session/text_encoding.h"

namespace zal {

namespace {

// Small pieces are gathered: few writes matter more than the memory of one buffer.
constexpr std::size_t kBufferSize = 256U * 1024U;
// Larger ones go to the system as they are, for gathering them would only copy them once more.
constexpr std::size_t kLargePiece = 64U * 1024U;
// A stretch is cut here, so that it is still in the processor's cache when it is written.
constexpr std::ptrdiff_t kLargestStretch = 256 * 1024;
// Lines ahead that are asked for, and how far into them: most are not longer than two cache lines.
constexpr std::size_t kLinesAhead = 8;
constexpr std::size_t kCacheLine = 64;

class BufferedFile {
 public:
  explicit BufferedFile(const std::string& path) : _file(openFreshFile(path)) {
    if (_file == nullptr) {
      _error = errno;
      return;
    }
    std::setvbuf(_file, nullptr, _IONBF, 0);
    _buffer = std::make_unique_for_overwrite<char[]>(kBufferSize);
  }
  BufferedFile(const BufferedFile&) = delete;
  BufferedFile& operator=(const BufferedFile&) = delete;
  ~BufferedFile() { close(); }

  [[nodiscard]] bool failed() const { return _error != 0; }

  void append(std::string_view bytes) {
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

  /// Zero, or the error number of the first thing that went wrong.
  int close() {
    if (_file == nullptr) return _error;
    _flush();
    if (std::fclose(std::exchange(_file, nullptr)) != 0) _note();
    return _error;
  }

 private:
  void _flush() {
    _write({_buffer.get(), _used});
    _used = 0;
  }
  void _write(std::string_view bytes) {
    if (failed() || bytes.empty()) return;
    if (std::fwrite(bytes.data(), 1, bytes.size(), _file) != bytes.size()) _note();
  }
  void _note() {
    if (_error == 0) _error = errno != 0 ? errno : EIO;
  }

  std::FILE* _file;
  std::unique_ptr<char[]> _buffer;
  std::size_t _used = 0;
  int _error = 0;
};

}  // namespace

bool writeStrings(const LogLines& strings, const std::string& path, AgentLog& log) {
  BufferedFile file(path);
  // Neighbours in the file are mostly neighbours in the arena too, newline included; they go together.
  const bool plain = !strings.texts || strings.texts->isAscii();
  const char* begin = nullptr;
  const char* end = nullptr;
  for (std::size_t number = 0; number < strings.lines.size(); ++number) {
    const std::string_view line = strings.lines[number];
    const char* const later = strings.lines[std::min(number + kLinesAhead, strings.lines.size() - 1)].data();
    fetchSoon(later);
    fetchSoon(later, kCacheLine);
    const std::size_t units = plain ? line.size() : std::min(utf16Length(line), line.size());
    if (line.data() != end || end - begin >= kLargestStretch) {
      file.append({begin, static_cast<std::size_t>(end - begin)});
      if (file.failed()) break;
      begin = line.data();
    }
    end = line.data() + units + 1;
  }
  file.append({begin, static_cast<std::size_t>(end - begin)});
  const int error = file.close();
  if (error != 0) log.warning("Could not write " + path + ": " + std::generic_category().message(error));
  return error == 0;
}

}  // namespace zal
