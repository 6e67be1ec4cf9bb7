#pragma once

#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "tests/support/manual_run_loop.h"

namespace zal::testing {

/// The manual loop behind the words of the contract tests.
struct ManualHost {
  ManualRunLoop runLoop;
  RunLoop& loop = runLoop;
  Clock& clock = runLoop;
  /// Runs the loop for that long.
  void runFor(std::chrono::nanoseconds duration) { runLoop.advance(duration); }
};

/// The real one; time really passes.
struct LinuxHost {
  LinuxRunLoop runLoop;
  LinuxClock realClock;
  RunLoop& loop = runLoop;
  Clock& clock = realClock;
  /// However late it is then: what was posted before is over.
  void runFor(std::chrono::nanoseconds duration) {
    loop.callAfter(duration, [this] { loop.post([this] { loop.stop(); }); });
    loop.run();
  }
};

}  // namespace zal::testing
