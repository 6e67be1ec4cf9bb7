#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/clock.h"

namespace zal::tessel {

/// When a line of a syslog file was written: "2024-11-21T17:34:18.123456+01:00" or "Nov 21 17:34:18" at
/// its beginning, a blank behind. Nothing for a line that begins otherwise: it goes on with the one
/// before. The second form says no year: it becomes the latest one that is not more than a day ahead of
/// `now`.
[[nodiscard]] std::optional<WallTime> syslogLineTime(std::string_view line, WallTime now, const Clock& clock);

/// The line as it is printed, with its line end: a time in the first form as all tessel's times, control
/// characters escaped, a line that has no time marked as a further line.
[[nodiscard]] std::string printedSyslogLine(std::string_view line, WallTime now, const Clock& clock);

}  // namespace zal::tessel
