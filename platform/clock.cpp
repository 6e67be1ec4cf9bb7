#include "platform/clock.h"

#include <cmath>

namespace zal {

namespace {
// 0001-01-01T00:00:00Z and 9999-12-31T23:59:59Z: the years that four digits can show.
constexpr double kFirstSecond = -62135596800.0;
constexpr double kLastSecond = 253402300799.0;
constexpr double kMicroseconds = 1e6;
}  // namespace

double secondsSinceEpoch(WallTime moment) {
  return static_cast<double>(moment.time_since_epoch().count()) / kMicroseconds;
}

WallTime wallTimeFromSeconds(double seconds) {
  if (std::isnan(seconds)) return WallTime{};
  if (seconds < kFirstSecond) seconds = kFirstSecond;
  if (seconds > kLastSecond) seconds = kLastSecond;
  return WallTime{std::chrono::microseconds{std::llround(seconds * kMicroseconds)}};
}

}  // namespace zal
