#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace zal {

/// A file of any size, looked at through a piece of memory that goes along.
class RecordWindow {
 public:
  /// Fills the whole buffer from there; never asked for what lies beyond the size.
  using Fill = std::function<void(std::uint64_t offset, char* buffer, std::size_t size)>;
  RecordWindow(std::uint64_t size, std::size_t width, Fill fill);

  [[nodiscard]] std::uint64_t size() const { return _size; }
  /// At least so many bytes from there, and more where they are at hand; fewer only at the end. Longer ones
  /// than the width make it wider for as long as they are looked at. Valid until the next call.
  [[nodiscard]] std::string_view from(std::uint64_t offset, std::size_t atLeast);
  /// Where the text stands, from there on; the size when it does not.
  [[nodiscard]] std::uint64_t find(std::string_view text, std::uint64_t offset);
  /// One past the last byte from there on that is not zero; the offset when there is none.
  [[nodiscard]] std::uint64_t endOfContent(std::uint64_t offset);

 private:
  const std::uint64_t _size;
  const std::size_t _width;
  const Fill _fill;
  std::uint64_t _begin = 0;  ///< of the buffer in the file
  std::string _buffer;
};

}  // namespace zal
