#pragma once

#include <chrono>
#include <functional>

#include <gtest/gtest.h>

#include "platform/run_loop.h"

namespace zal::testing {

/// Lets the loop run until the condition holds; a failure when it does not within three minutes.
inline void runUntil(RunLoop& loop, const std::function<bool()>& condition) {
  const ScopedTimer check(loop, loop.callEvery(std::chrono::milliseconds{1}, [&] {
    if (condition()) loop.stop();
  }));
  const ScopedTimer limit(loop, loop.callAfter(std::chrono::minutes{3}, [&] {
    ADD_FAILURE() << "the condition never held";
    loop.stop();
  }));
  loop.run();
}

}  // namespace zal::testing
