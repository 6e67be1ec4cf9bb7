#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace zal {

/// Bytes of the longest log set name: with the longest ending of a file of the set,
/// "-Event.log.ready-18446744073709551615.zip", the file name still has at most 255.
inline constexpr std::size_t kLongestLogSetName = 214;
/// What a type that names nothing is kept under.
inline constexpr std::string_view kDefaultLogSetName = "ZalLogging";

/// The log set that records of a type belong to, safe as one component of a path: the type's last
/// path component, control characters as '_', cut at a character's boundary. A type without one, and
/// "." and "..", go to the default set.
[[nodiscard]] std::string logSetName(std::string_view type);
/// Whether the type is its own log set name already.
[[nodiscard]] bool isLogSetName(std::string_view type);

/// Whether a record is an event: its category is its type followed by "-Event".
[[nodiscard]] bool isEventCategory(std::string_view type, std::string_view category);
/// "<name>.log", or "<name>-Event.log" for events.
[[nodiscard]] std::string logFileName(std::string_view setName, bool isEvent);

}  // namespace zal
