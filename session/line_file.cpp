#include "session/line_file.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

#include <algorithm>
#include <memory>
#include <system_error>
#include <utility>

#include "session/text_encoding.h"

namespace zal {

namespace {

// Few writes matter more than the memory of one buffer for the time of one file.
constexpr std::size_t kBufferSize = 1U << 20U;

class BufferedFile {
 public:
  explicit BufferedFile(const std::string& path) : _file(std::fopen(path.c_str(), "wb")) {
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
    while (!bytes.empty() && !failed()) {
      const std::size_t part = std::min(bytes.size(), kBufferSize - _used);
      std::memcpy(_buffer.get() + _used, bytes.data(), part);
      _used += part;
      bytes.remove_prefix(part);
      if (_used == kBufferSize) _flush();
    }
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
    if (!failed() && std::fwrite(_buffer.get(), 1, _used, _file) != _used) _note();
    _used = 0;
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

void writeStrings(const std::vector<std::string_view>& strings, const std::string& path, AgentLog& log) {
  BufferedFile file(path);
  for (const std::string_view line : strings) {
    if (file.failed()) break;
    const std::size_t bytes = utf16Length(line) + 1;
    file.append(line.substr(0, bytes));
    if (bytes > line.size()) file.append("\n");
  }
  if (const int error = file.close(); error != 0) {
    log.warning("Could not write " + path + ": " + std::generic_category().message(error));
  }
}

}  // namespace zal
