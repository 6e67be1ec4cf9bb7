#pragma once

#include <time.h>

#include <cstdint>

namespace zal::bench {

[[nodiscard]] inline double nowSeconds() {
  timespec now{};
  clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

inline void pauseMicroseconds(long count) {
  const timespec length{count / 1'000'000, (count % 1'000'000) * 1000};
  nanosleep(&length, nullptr);
}

inline void pauseMilliseconds(long count) { pauseMicroseconds(count * 1000); }

/// Seconds since it was made.
class Stopwatch {
 public:
  [[nodiscard]] double seconds() const { return nowSeconds() - _start; }

 private:
  double _start = nowSeconds();
};

/// Asks again every half millisecond. Returned: whether it came true in time.
template <typename Condition>
[[nodiscard]] bool waitUntil(double limitSeconds, Condition condition) {
  const Stopwatch since;
  while (!condition()) {
    if (since.seconds() > limitSeconds) return condition();
    pauseMicroseconds(500);
  }
  return true;
}

}  // namespace zal::bench
