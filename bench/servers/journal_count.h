#pragma once

#include <cstdint>
#include <filesystem>

namespace zal::bench {

/// How many entries a journal holds, read from the header of its mapped file; follows rotations.
///
///     0          16       152
///     | "LPKSHHRH" … | state … | entries (64 bits, little-endian) |
class JournalCount {
 public:
  JournalCount() = default;
  ~JournalCount();
  JournalCount(const JournalCount&) = delete;
  JournalCount& operator=(const JournalCount&) = delete;

  void watch(std::filesystem::path activeFile);
  [[nodiscard]] std::uint64_t entries();

 private:
  void _open();
  void _close();
  std::filesystem::path _path;
  const volatile unsigned char* _header = nullptr;
  std::uint64_t _inode = 0;
  std::uint64_t _inEarlierFiles = 0;
};

}  // namespace zal::bench
