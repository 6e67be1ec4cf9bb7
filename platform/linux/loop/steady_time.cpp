#include "platform/linux/loop/steady_time.h"

#include <time.h>

namespace zal {
namespace {

SteadyTime read(clockid_t clock) {
  timespec now{};
  ::clock_gettime(clock, &now);
  return SteadyTime(std::chrono::seconds(now.tv_sec) + std::chrono::nanoseconds(now.tv_nsec));
}

struct LastTick {
  SteadyTime tick;
  SteadyTime time;
};

}  // namespace

SteadyTime steadyTime() { return read(CLOCK_BOOTTIME); }

SteadyTime roughSteadyTime() {
  thread_local LastTick last;
  // The one clock that is read without asking the hardware stands still in sleep, so it only says
  // whether there is anything new.
  const SteadyTime tick = read(CLOCK_MONOTONIC_COARSE);
  if (tick != last.tick) last = {tick, steadyTime()};
  return last.time;
}

}  // namespace zal
