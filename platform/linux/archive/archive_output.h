#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <system_error>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// A new file that is mostly written from front to back; writes further in front are patches. The first
/// error stays, and nothing is written after it. Not for several threads.
class ArchiveOutput {
 public:
  /// Whatever stands at the path already is an error.
  explicit ArchiveOutput(const std::string& path);

  /// Whether the file is ours to remove.
  [[nodiscard]] bool isMade() const { return _made; }
  [[nodiscard]] const std::error_code& error() const { return _error; }
  [[nodiscard]] std::uint64_t position() const { return _position; }
  [[nodiscard]] std::uint64_t size() const { return _flushed + _buffered; }
  /// Device and inode, so that an archive does not hold itself.
  [[nodiscard]] bool is(std::uint64_t device, std::uint64_t inode) const {
    return device == _device && inode == _inode;
  }

  void write(const char* bytes, std::size_t size);
  /// To any place up to the end.
  void seek(std::uint64_t position) { _position = position < size() ? position : size(); }
  /// Brings everything to the disk and lets go of the copy in memory, so that a reader reads the disk.
  void sync();

 private:
  void _flush();
  void _writeAt(std::uint64_t position, const char* bytes, std::size_t size);

  Descriptor _file;
  const bool _made;
  std::error_code _error;
  std::uint64_t _device = 0, _inode = 0;
  std::uint64_t _position = 0;
  std::uint64_t _flushed = 0;   // bytes of the file that were handed to the kernel
  std::uint64_t _onItsWay = 0;  // of those, the ones that the disk was asked to take already
  const std::unique_ptr<char[]> _buffer;
  std::size_t _buffered = 0;
};

}  // namespace zal
