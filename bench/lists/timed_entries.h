#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

namespace zal::bench {

/// An order in which timed entries may arrive.
struct ArrivalOrder {
  std::string_view name;
  std::vector<double> times;
};

/// Rising, falling, random (the same each time), from both ends towards the middle, and all at once.
[[nodiscard]] std::vector<ArrivalOrder> arrivalOrders(std::uint64_t entries);

/// Seconds to take all entries in that order and to hand them out by time: by the sorted log list, and
/// by a std::multimap<double, std::string>. The process ends when the outcome is not in order.
[[nodiscard]] double secondsOfSortedList(const std::vector<double>& times);
[[nodiscard]] double secondsOfMultimap(const std::vector<double>& times);

}  // namespace zal::bench
