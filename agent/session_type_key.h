#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace zal {

inline constexpr std::string_view kDefaultSessionType = "Current";
/// Bytes that a file name may have: a key names a directory.
inline constexpr std::size_t kLongestSessionTypeKey = 255;

/// The type a client sent, or the default one when it sent none or an empty one.
[[nodiscard]] std::string_view sessionTypeOrDefault(std::optional<std::string_view> type);

/// What a session is registered and its directory named under: the last path component of the type
/// ("a/Vistel/" gives "Vistel"). Always a name that stays inside the directory it is used in: "",
/// "/", "." and ".." give the default type, control characters become "_", and what exceeds
/// kLongestSessionTypeKey is cut off at a character's border.
[[nodiscard]] std::string sessionTypeKey(std::optional<std::string_view> type);

}  // namespace zal
