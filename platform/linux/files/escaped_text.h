#pragma once

#include <string>
#include <string_view>

namespace zal {

// Text of others in records of one line. Printable text stands as it is; control characters and bytes
// that are no UTF-8 become "\x" and two hexadecimal digits, a backslash becomes "\\". Pure functions.

/// The text as part of one line.
[[nodiscard]] std::string escapedLine(std::string_view text);
/// The text as one word: blanks are escaped too.
[[nodiscard]] std::string escapedWord(std::string_view text);
/// What was escaped. A backslash that begins no escape stands for itself.
[[nodiscard]] std::string unescaped(std::string_view text);

/// The longest beginning of the text that has at most so many bytes and cuts no character.
[[nodiscard]] std::string_view cutAtCharacter(std::string_view text, std::size_t mostBytes);

}  // namespace zal
