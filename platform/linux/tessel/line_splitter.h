#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace zal::tessel {

/// Bytes in any pieces, out as whole lines. A line longer than the limit comes in several.
class LineSplitter {
 public:
  static constexpr std::size_t kLongestLine = 1U << 20U;

  void add(std::string_view bytes);
  /// The next whole line without its end; valid until the next call of either. Nothing when there is
  /// none yet.
  [[nodiscard]] std::optional<std::string_view> next();
  /// What has no line end so far, which then is forgotten.
  [[nodiscard]] std::string takeRest();
  /// Nothing up to the next line end is a line: the bytes before were not seen.
  void skipBrokenLine() { _skips = true; }

 private:
  std::string _buffer;
  std::size_t _start = 0;    ///< of what has not been handed out
  std::size_t _scanned = 0;  ///< no line end before this
  bool _skips = false;
};

}  // namespace zal::tessel
