#pragma once

#include "platform/clock.h"

namespace zal {

/// Time since the host started, its sleep included: who is idle for an hour of sleep was idle for an
/// hour. The same on every thread.
[[nodiscard]] SteadyTime steadyTime();

/// The same as of some moment in the kernel's present tick (1 to 10 ms), never ahead of it: two looks in
/// one tick and on one thread are equal, and the second costs a quarter.
[[nodiscard]] SteadyTime roughSteadyTime();

}  // namespace zal
