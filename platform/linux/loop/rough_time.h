#pragma once

#include <time.h>

#include "platform/clock.h"

namespace zal {

/// Steady time as of the kernel's last tick (1 to 10 ms ago): read without asking the hardware.
[[nodiscard]] inline SteadyTime roughSteadyTime() {
  timespec now{};
  ::clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
  return SteadyTime(std::chrono::seconds(now.tv_sec) + std::chrono::nanoseconds(now.tv_nsec));
}

}  // namespace zal
