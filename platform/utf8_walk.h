#pragma once

#include <cstddef>
#include <string_view>

namespace zal {

/// The character that a text begins with; for a byte that begins none, that byte and `valid` false.
struct LeadingCharacter {
  char32_t code = 0;
  std::size_t length = 1;
  bool valid = false;
};

/// `text` is not empty.
[[nodiscard]] LeadingCharacter leadingCharacter(std::string_view text);

/// False for control characters, line and direction marks, and what else changes how a terminal
/// shows its surroundings.
[[nodiscard]] bool isHarmless(char32_t code);

}  // namespace zal
