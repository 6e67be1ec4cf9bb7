#pragma once

#include <string>

#include "platform/clock.h"

namespace zal {

// Dates as names and lines show them: Gregorian, in the zone that the moment was taken apart in,
// whatever the process locale.

/// "2024-05-02 at 14-03-07"
[[nodiscard]] std::string sessionDateText(const LocalTime& time);
/// "14-03-07"
[[nodiscard]] std::string fileTimeText(const LocalTime& time);
/// "14:03:07.251  (2024-05-02)", two blanks before the parenthesis.
[[nodiscard]] std::string entryDateText(const LocalTime& time);
/// "2024_05_02_14_03_07"
[[nodiscard]] std::string stampText(const LocalTime& time);

/// Overwrites the milliseconds of an entryDateText; 0 to 999.
void setEntryMilliseconds(std::string& entryDate, int milliseconds);

}  // namespace zal
