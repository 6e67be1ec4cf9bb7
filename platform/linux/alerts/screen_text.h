#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace zal {

// An alert's texts as a screen gets them. They may hold file names and what clients wrote, so nothing
// in them may act on a screen or fill it. Pure functions over well-formed UTF-8.

/// One line for a title or a button: control characters and line ends become blanks.
[[nodiscard]] std::string screenLine(std::string_view text, std::size_t mostCharacters);
/// Several lines: control characters but line ends become blanks. What is too long ends in "...", the
/// one character U+2026.
[[nodiscard]] std::string screenText(std::string_view text, std::size_t mostCharacters);
/// The text in lines of at most so many characters, broken at blanks where there are any, and of at most
/// so many lines, for screens that break none.
[[nodiscard]] std::string foldedText(std::string_view text, std::size_t width, std::size_t mostLines);

}  // namespace zal
