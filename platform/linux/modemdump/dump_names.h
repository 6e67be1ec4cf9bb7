#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "platform/clock.h"

namespace zal::modemdump {

/// How the names of all files of all sets begin.
inline constexpr std::string_view kFamily = "modemd-";
/// Sets that are kept, the new one included. Dumps hold links of their own to those that went.
inline constexpr std::size_t kMostSets = 10;

/// What all files of one set have in common: "modemd-2026-11-20-20-50-00-". Whoever looks for sets
/// reads the local time behind the seventh byte, in names of at least 27 bytes.
[[nodiscard]] std::string setPrefix(const LocalTime& time);
/// The prefix of the new set: that of the moment, or of the first second after it that no file there
/// is named after.
[[nodiscard]] std::string newSetPrefix(const std::vector<std::string>& names, WallTime moment,
                                       const Clock& clock);
/// The names that belong to sets of ours older than those that are kept.
[[nodiscard]] std::vector<std::string> outdatedNames(std::vector<std::string> names,
                                                     std::size_t keptSets = kMostSets);

}  // namespace zal::modemdump
