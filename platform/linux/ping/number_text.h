#pragma once

#include <array>
#include <charconv>
#include <string>

namespace zal {

/// Always with a point, whatever the locale: "0.045".
[[nodiscard]] inline std::string fixedNumber(double value, int decimals) {
  std::array<char, 400> text{};
  const auto end =
      std::to_chars(text.data(), text.data() + text.size(), value, std::chars_format::fixed, decimals);
  return {text.data(), end.ptr};
}

/// At most six significant digits and no zeros at the end: "33.3333", "0".
[[nodiscard]] inline std::string shortNumber(double value) {
  std::array<char, 32> text{};
  const auto end =
      std::to_chars(text.data(), text.data() + text.size(), value, std::chars_format::general, 6);
  return {text.data(), end.ptr};
}

}  // namespace zal
