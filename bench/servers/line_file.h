#pragma once

#include <cstdint>
#include <filesystem>

namespace zal::bench {

/// A file to which a daemon appends lines of one length, which the first line to arrive tells.
class LineFile {
 public:
  LineFile() = default;
  ~LineFile();
  LineFile(const LineFile&) = delete;
  LineFile& operator=(const LineFile&) = delete;

  /// The file need not exist yet.
  void watch(std::filesystem::path path);
  /// Takes the only record so far as the measure. Returned: false while there is none.
  [[nodiscard]] bool learnLineLength();
  [[nodiscard]] std::uint64_t lines();
  /// Counts line ends by reading.
  [[nodiscard]] std::uint64_t linesByReading() const;

 private:
  [[nodiscard]] std::uint64_t _size();
  std::filesystem::path _path;
  int _descriptor = -1;
  std::uint64_t _lineLength = 0;
};

}  // namespace zal::bench
