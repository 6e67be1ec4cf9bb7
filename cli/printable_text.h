#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The text as one line that is safe to show anywhere: control characters, line breaks, marks that turn
/// the direction of text and bytes that are no UTF-8 become \n, \t, \x1b, \u202e and the like.
[[nodiscard]] std::string printableLine(std::string_view text);
/// The same for a text of several lines, whose line breaks and tabs stay.
[[nodiscard]] std::string printableLines(std::string_view text);

}  // namespace zal
