#pragma once

#include <algorithm>
#include <array>
#include <string_view>

namespace zal {

namespace detail {
template <const std::string_view&... kParts>
constexpr auto joinedCharacters() {
  std::array<char, (kParts.size() + ...)> characters{};
  auto* end = characters.data();
  ((end = std::copy(kParts.begin(), kParts.end(), end)), ...);
  return characters;
}
template <const std::string_view&... kParts>
inline constexpr auto kJoinedCharacters = joinedCharacters<kParts...>();
}  // namespace detail

/// Several constant texts as one, for tables of constants whose rows share parts.
template <const std::string_view&... kParts>
inline constexpr std::string_view kJoined{detail::kJoinedCharacters<kParts...>.data(),
                                          detail::kJoinedCharacters<kParts...>.size()};

}  // namespace zal
