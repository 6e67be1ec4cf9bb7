#pragma once

#include <cstddef>
#include <cstdio>
#include <memory>
#include <string>
#include <string_view>

namespace zal {

class FilePlacement;

/// A fresh file that takes pieces of any size in few writes. After the first failure it takes nothing more.
/// Any thread, one at a time.
class BufferedFile {
 public:
  BufferedFile(FilePlacement& files, const std::string& path);
  BufferedFile(const BufferedFile&) = delete;
  BufferedFile& operator=(const BufferedFile&) = delete;
  ~BufferedFile() { close(); }

  [[nodiscard]] bool failed() const { return _error != 0; }
  void append(std::string_view bytes);
  /// Zero, or the error number of the first thing that went wrong.
  int close();

 private:
  void _flush();
  void _write(std::string_view bytes);
  void _note();

  std::FILE* _file;
  std::unique_ptr<char[]> _buffer;
  std::size_t _used = 0;
  int _error = 0;
};

}  // namespace zal
