#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace zal {

/// One step through a text: a code point, or the longest beginning of one that breaks off.
struct Utf8Step {
  char32_t codePoint = 0;
  std::size_t size = 0;  ///< bytes, at least one
  bool valid = true;
};

/// The step that begins a text with at least one byte.
[[nodiscard]] Utf8Step nextUtf8(std::string_view text);

/// Well-formed as Unicode defines it: no surrogates, no overlong forms, nothing above U+10FFFF.
[[nodiscard]] bool isUtf8(std::string_view text);

/// Each maximal part that could have begun a character becomes one U+FFFD, as Unicode recommends.
[[nodiscard]] std::string replacedUtf8(std::string_view text);

}  // namespace zal
