#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/clock.h"

namespace zal {

/// The forms in which daemons put local times into the names of their files: a digit for each
/// letter, every other character as it stands.
inline constexpr std::string_view kDashedTimestamp = "yyyy-MM-dd-HH-mm-ss";
inline constexpr std::string_view kCompactTimestamp = "yyyy-MM-dd-HHmmss";

/// The moment that a text of that form names; nothing for any other text or an impossible date.
[[nodiscard]] std::optional<WallTime> parseTimestamp(std::string_view text, std::string_view form,
                                                     const Clock& clock);
/// The reverse; fractions of a second are dropped.
[[nodiscard]] std::string timestampText(WallTime moment, std::string_view form, const Clock& clock);

/// The timestamp that stands in the name from the position (bytes) on. Throws std::out_of_range when
/// the name ends before it does.
[[nodiscard]] std::optional<WallTime> timestampAt(std::string_view name, std::size_t position,
                                                  std::string_view form, const Clock& clock);

/// What was written by a dump is stamped later than this. Whole seconds in names lose up to one
/// second, hence the margin.
[[nodiscard]] constexpr WallTime dumpLimit(WallTime startTime) { return startTime - std::chrono::seconds{1}; }

}  // namespace zal
