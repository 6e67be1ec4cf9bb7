#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <system_error>

#include "platform/linux/archive/zip_directory.h"

struct inflate_state;

namespace zal {

/// Unpacks entries of an archive and throws the content away. Not for several threads, but several may
/// read one file.
class EntryCheck {
 public:
  /// The file stays the caller's. Throws std::bad_alloc.
  explicit EntryCheck(int archive);
  ~EntryCheck();
  EntryCheck(const EntryCheck&) = delete;
  EntryCheck& operator=(const EntryCheck&) = delete;

  /// What is wrong with the entry: its header, its content, its length or its checksum. Empty: nothing.
  [[nodiscard]] std::string check(const ZipDirectoryEntry& entry);
  /// The same without the name, handing on the content as it comes: never more of it than the entry's
  /// size says, and nothing that can be relied on before the end.
  using Content = std::function<void(const char* bytes, std::size_t size)>;
  [[nodiscard]] std::string troubleOf(const ZipDirectoryEntry& entry, const Content& content);

 private:
  [[nodiscard]] std::size_t _read(std::uint64_t position, std::uint64_t limit);
  [[nodiscard]] bool _readStored(std::uint64_t position, std::uint64_t size, const Content& content);
  [[nodiscard]] bool _inflate(std::uint64_t position, std::uint64_t packed, std::uint64_t size,
                              const Content& content);
  void _take(const unsigned char* bytes, std::size_t size, const Content& content);

  const int _archive;
  const std::unique_ptr<inflate_state> _state;
  const std::unique_ptr<unsigned char[]> _input, _output;
  std::uint32_t _crc = 0;
  std::error_code _error;
};

}  // namespace zal
