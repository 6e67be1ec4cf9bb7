#pragma once

#include <cstddef>
#include <string_view>

namespace zal {

[[nodiscard]] bool isAscii(std::string_view text);

/// Length of well-formed UTF-8 in UTF-16 units; never more than its bytes.
[[nodiscard]] std::size_t utf16Length(std::string_view text);

/// Its beginning with at most so many UTF-16 units, never less than whole characters. Well-formed UTF-8.
[[nodiscard]] std::string_view utf16Prefix(std::string_view text, std::size_t units);

/// Whether it is well-formed UTF-8: no overlong forms, no surrogates, nothing above U+10FFFF.
[[nodiscard]] bool isValidUtf8(std::string_view text);

/// Without white space and line breaks at both ends. Well-formed UTF-8.
[[nodiscard]] std::string_view trimmed(std::string_view text);

}  // namespace zal
