#pragma once

#include <cstddef>
#include <string>

#include "platform/linux/wire/flex_value.h"

namespace zal {

inline constexpr std::size_t kLongestDescription = 8192;    ///< bytes, apart from the closing note
inline constexpr std::size_t kLongestDescribedText = 1024;  ///< bytes of one text

/// The map on one printable line, for people: {"level": 6, "time": 7u, "text": "a\nb", "n": <4.5>}.
/// Unsigned numbers end in u, coded values stand in angle brackets. Line breaks, other control
/// characters and those that turn the direction of text are escaped, invalid bytes show as \xHH.
/// A text cut short is followed by its whole size, a line cut short by "… (cut)".
[[nodiscard]] std::string messageDescription(const FlexMap& map);

}  // namespace zal
