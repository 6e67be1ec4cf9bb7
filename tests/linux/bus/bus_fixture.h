#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <functional>
#include <string>

#include "platform/configuration.h"
#include "platform/linux/bus_module/bus_host.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"
#include "platform/linux/loop/loop_descriptor_watcher.h"
#include "tests/support/fake_services.h"
#include "tests/support/private_bus.h"
#include "tests/support/wait_watch.h"

namespace zal::testing {

/// A real bus, and the real loop and queues of an agent on it, which both buses are the same for.
class BusFixture : public ::testing::Test {
 protected:
  void SetUp() override {
    if (const std::string obstacle = PrivateBus::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  }

  /// Runs the loop until the condition holds; false when it does not within three minutes.
  bool runUntil(const std::function<bool()>& condition) { return _run(condition, std::chrono::minutes(3)); }
  /// For what must not happen: runs the loop for that long.
  void runFor(std::chrono::milliseconds time) {
    (void)_run([] { return false; }, time);
  }

  /// How often the loop's thread was seen waiting for somebody while the work ran its course on it.
  template <class Work>
  unsigned strayWaitsDuring(Work work) {
    const WaitWatch watch(::getpid(), ::gettid());
    watch.awaitLook();
    work();
    watch.awaitLook();
    return watch.strayWaits();
  }

  PrivateBus bus;
  RecordingAgentLog log;
  Configuration configuration;
  LinuxClock clock;
  LinuxRunLoop loop;
  LinuxWorkQueues queues{loop, [](std::string_view line) { FAIL() << line; }};
  LoopDescriptorWatcher descriptors{loop.context()};
  BusHost host{.configuration = configuration,
               .clock = clock,
               .mainLoop = loop,
               .queues = queues,
               .log = log,
               .descriptors = descriptors,
               .systemBus = bus.address(),
               .sessionBus = bus.address()};

 private:
  bool _run(const std::function<bool()>& condition, std::chrono::milliseconds limit) {
    const SteadyTime deadline = clock.steadyNow() + limit;
    bool held = condition();
    const ScopedTimer look(loop, loop.callEvery(std::chrono::milliseconds(1), [&] {
      held = condition();
      if (held || clock.steadyNow() >= deadline) loop.stop();
    }));
    if (!held) loop.run();
    return held;
  }
};

}  // namespace zal::testing
