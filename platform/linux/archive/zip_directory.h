#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <system_error>

namespace zal {

/// What an archive's directory says about one entry.
struct ZipDirectoryEntry {
  std::string name;
  unsigned method = 0;
  std::uint32_t crc = 0;
  std::uint64_t packedSize = 0, size = 0;
  std::uint64_t header = 0;  ///< where its own header stands
  unsigned mode = 0;         ///< as stat() has it; 0 where the maker knew none
};

/// Reads bytes of a file at any place. Returned: whether all of them were there.
[[nodiscard]] bool readAt(int file, std::uint64_t position, char* bytes, std::size_t size);

/// Goes through the directory of an archive as this agent writes them: no comment, all on one disk. Takes
/// the wide fields of large archives, which minizip's reader of zlib 1.2 overlooks on 64-bit hosts, and
/// holds one entry at a time, so that memory does not grow with their number. Not for several threads.
class ZipDirectory {
 public:
  /// The file stays the caller's.
  explicit ZipDirectory(int file);

  /// Whether there is a directory and the archive ends right behind it.
  [[nodiscard]] bool isWhole() const { return _isWhole; }
  [[nodiscard]] std::uint64_t entries() const { return _entries; }
  /// The next entry; nothing behind the last one or when what comes is no entry.
  [[nodiscard]] std::optional<ZipDirectoryEntry> next();
  /// Whether all of it was gone through.
  [[nodiscard]] bool isAtEnd() const { return _at == _end; }
  void rewind() { _at = _begin; }

  /// Where the entry's content begins; nothing when its own header does not say the same as the directory.
  [[nodiscard]] static std::optional<std::uint64_t> contentOf(int file, const ZipDirectoryEntry& entry);

 private:
  [[nodiscard]] bool _findDirectory();
  [[nodiscard]] bool _read(std::uint64_t position, char* bytes, std::size_t size);

  const int _file;
  bool _isWhole = false;
  std::uint64_t _entries = 0;
  std::uint64_t _begin = 0, _end = 0, _at = 0;
  const std::unique_ptr<char[]> _buffer;  // what follows _bufferBegin in the file
  std::uint64_t _bufferBegin = 0;
  std::size_t _bufferSize = 0;
};

}  // namespace zal
