#pragma once

#include <sys/stat.h>

#include <cstddef>
#include <cstdint>
#include <string>

#include "platform/linux/archive/archive_output.h"

namespace zal {

enum class ZipMethod { stored, deflated };

/// One entry's place in the archive: its name in UTF-8, a directory's ending with a slash, and whose
/// mode and time of modification it gets.
struct ArchiveEntry {
  std::string name;
  struct stat status {};
};

/// Puts a zip archive together from content that is compressed already. Errors of the output and names
/// that are too long for the format end as std::system_error. Not for several threads.
class ZipContainer {
 public:
  explicit ZipContainer(ArchiveOutput& output);
  ~ZipContainer();
  ZipContainer(const ZipContainer&) = delete;
  ZipContainer& operator=(const ZipContainer&) = delete;

  /// `expectedSize`: of the content before compression; it may turn out smaller.
  void beginEntry(const ArchiveEntry& entry, ZipMethod method, std::uint64_t expectedSize);
  void write(const char* bytes, std::size_t size);
  void endEntry(std::uint64_t size, std::uint32_t crc);
  /// Writes the directory; the output is complete then, but not synced.
  void finish();
  [[nodiscard]] std::uint64_t entries() const { return _entries; }

 private:
  void _check(int result) const;
  void _addWideEnd(std::uint64_t directory);

  ArchiveOutput& _output;
  void* _archive = nullptr;
  std::uint64_t _entries = 0;
};

}  // namespace zal
