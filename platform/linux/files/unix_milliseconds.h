#pragma once

#include <chrono>
#include <cstdint>
#include <optional>

#include "platform/clock.h"

namespace zal {

/// How records tell a moment: milliseconds since 1970 UTC.
[[nodiscard]] inline std::int64_t unixMilliseconds(WallTime moment) {
  return std::chrono::floor<std::chrono::milliseconds>(moment).time_since_epoch().count();
}

/// The moment that was told; nothing for one that is not in the years 1970 to 9999.
[[nodiscard]] inline std::optional<WallTime> momentOfUnixMilliseconds(std::int64_t milliseconds) {
  constexpr std::int64_t kEndOf9999 = 253'402'300'799'999;
  if (milliseconds < 0 || milliseconds > kEndOf9999) return std::nullopt;
  return WallTime{std::chrono::milliseconds{milliseconds}};
}

}  // namespace zal
