#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "tests/linux/loop/run_loop_hosts.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

/// What every run loop promises. Times are short: the real loop waits them out.
template <class Host>
class RunLoopContractTest : public ::testing::Test {
 protected:
  RunLoop::Task note(char name) {
    return [this, name] { trace += name; };
  }
  Host host;
  RunLoop& loop = host.loop;
  std::string trace;
};

using LoopHosts = ::testing::Types<ManualHost, LinuxHost>;
TYPED_TEST_SUITE(RunLoopContractTest, LoopHosts);

TYPED_TEST(RunLoopContractTest, RunsPostedTasksInTheirOrderAndNeverInsidePost) {
  this->loop.post([this] {
    this->loop.post(this->note('c'));
    this->trace += 'a';
  });
  this->loop.post(this->note('b'));
  EXPECT_EQ(this->trace, "");
  this->host.runFor(1ms);
  EXPECT_EQ(this->trace, "abc");
}

TYPED_TEST(RunLoopContractTest, StopReturnsAfterTheRunningTask) {
  this->loop.post([this] {
    this->loop.stop();
    this->trace += 'a';
  });
  this->loop.post(this->note('b'));
  this->loop.run();
  EXPECT_EQ(this->trace, "a");
  this->host.runFor(1ms);
  EXPECT_EQ(this->trace, "ab");
}

TYPED_TEST(RunLoopContractTest, AStopBeforeTheRunEndsIt) {
  this->loop.post(this->note('a'));
  this->loop.stop();
  this->loop.run();
  EXPECT_EQ(this->trace, "");
  this->host.runFor(1ms);
  EXPECT_EQ(this->trace, "a");
}

TYPED_TEST(RunLoopContractTest, ATimerFiresOnceAndNotBeforeItsDelay) {
  const SteadyTime start = this->host.clock.steadyNow();
  std::vector<SteadyTime> fired;
  this->loop.callAfter(20ms, [&] { fired.push_back(this->host.clock.steadyNow()); });
  this->host.runFor(60ms);
  ASSERT_EQ(fired.size(), 1U);
  EXPECT_GE(fired[0] - start, 20ms);
}

TYPED_TEST(RunLoopContractTest, TimersFireInTheOrderOfTheirDeadlines) {
  std::vector<TimerId> timers;
  // A host that stood still meanwhile has put their deadlines into another order.
  for (SteadyTime begin{}; timers.empty() || this->host.clock.steadyNow() - begin >= 2ms;) {
    for (const TimerId timer : timers) this->loop.cancel(timer);
    begin = this->host.clock.steadyNow();
    timers = {this->loop.callAfter(6ms, this->note('c')), this->loop.callAfter(4ms, this->note('b')),
              this->loop.callAfter(2ms, this->note('a')), this->loop.callAfter(0ms, this->note('0')),
              this->loop.callAfter(-5ms, this->note('1'))};
  }
  this->host.runFor(20ms);
  EXPECT_EQ(this->trace, "01abc");
}

TYPED_TEST(RunLoopContractTest, ACancelledTimerNeverFires) {
  const TimerId timer = this->loop.callAfter(2ms, this->note('a'));
  this->loop.cancel(timer);
  this->loop.cancel(timer);
  this->loop.cancel(TimerId::none);
  this->loop.cancel(TimerId{12345});
  this->host.runFor(10ms);
  EXPECT_EQ(this->trace, "");
}

TYPED_TEST(RunLoopContractTest, ATimerCancelledByAnotherThatIsDueWithItDoesNotFire) {
  TimerId second{};
  this->loop.callAfter(1ms, [&] { this->loop.cancel(second); });
  second = this->loop.callAfter(1ms, this->note('b'));
  this->host.runFor(10ms);
  EXPECT_EQ(this->trace, "");
}

TYPED_TEST(RunLoopContractTest, ARepeatingTimerKeepsItsGridUntilItIsCancelled) {
  const SteadyTime start = this->host.clock.steadyNow();
  std::vector<std::chrono::nanoseconds> beats;
  TimerId timer{};
  timer = this->loop.callEvery(10ms, [&] {
    beats.push_back(this->host.clock.steadyNow() - start);
    if (beats.size() < 3) return;
    this->loop.cancel(timer);
    this->loop.callAfter(30ms, [this] { this->loop.stop(); });
  });
  this->host.runFor(10s);
  ASSERT_EQ(beats.size(), 3U);
  EXPECT_GE(beats[0], 10ms);
  EXPECT_GE(beats[1], 20ms);
  EXPECT_GE(beats[2], 30ms);
}

TYPED_TEST(RunLoopContractTest, ATimerMayArmTheNextOne) {
  this->loop.callAfter(1ms, [this] {
    this->trace += 'a';
    this->loop.callAfter(1ms, this->note('b'));
    this->loop.callAfter(2ms, [this] { this->loop.stop(); });
  });
  this->host.runFor(10s);
  EXPECT_EQ(this->trace, "ab");
}

TYPED_TEST(RunLoopContractTest, SleepObserversRunOnceNothingIsLeftToDo) {
  this->loop.addSleepObserver(this->note('.'));
  this->loop.post([this] { this->loop.post(this->note('b')); });
  this->loop.post(this->note('a'));
  // A busy machine may let the end of a run come before its sleep.
  for (int tries = 0; tries < 1000 && this->trace.size() < 3; ++tries) this->host.runFor(1ms);
  EXPECT_EQ(this->trace.substr(0, 3), "ab.");
}

TYPED_TEST(RunLoopContractTest, SleepObserversRunAgainAfterATimer) {
  this->loop.addSleepObserver([this] {
    if (!this->trace.empty() && this->trace.back() != '.') this->trace += '.';
  });
  for (const char name : {'a', 'b'}) {
    this->loop.callAfter(1ms, this->note(name));
    // A busy machine may let the end of a run fall due together with the timer.
    for (int tries = 0; tries < 1000 && !this->trace.ends_with(std::string{name, '.'}); ++tries) {
      this->host.runFor(5ms);
    }
  }
  EXPECT_EQ(this->trace, "a.b.");
}

TYPED_TEST(RunLoopContractTest, WhatATaskThrowsPassesThroughAndTheLoopGoesOnAfterwards) {
  this->loop.post([] { throw std::runtime_error("broken"); });
  this->loop.post(this->note('b'));
  EXPECT_THROW(this->loop.run(), std::runtime_error);
  EXPECT_EQ(this->trace, "");
  this->host.runFor(1ms);
  EXPECT_EQ(this->trace, "b");
}

TYPED_TEST(RunLoopContractTest, WhatATimerThrowsPassesThroughToo) {
  this->loop.callAfter(1ms, [] { throw std::runtime_error("broken"); });
  this->loop.callAfter(2ms, this->note('b'));
  EXPECT_THROW(this->host.runFor(10ms), std::runtime_error);
  this->host.runFor(20ms);
  EXPECT_EQ(this->trace, "b");
}

TYPED_TEST(RunLoopContractTest, ARepeatingTimerWhoseTaskThrewGoesOn) {
  this->loop.callEvery(2ms, [this] {
    this->trace += 'a';
    if (this->trace == "a") throw std::runtime_error("broken");
    if (this->trace == "aaa") this->loop.stop();
  });
  EXPECT_THROW(this->host.runFor(10s), std::runtime_error);
  this->host.runFor(10s);
  EXPECT_EQ(this->trace.substr(0, 3), "aaa");
}

TYPED_TEST(RunLoopContractTest, SeveralThreadsMayPostAndEachKeepsItsOrder) {
  constexpr int kThreads = 4, kPosts = 2000;
  std::vector<std::vector<int>> seen(kThreads);
  {
    std::vector<std::jthread> threads;
    for (int thread = 0; thread < kThreads; ++thread) {
      threads.emplace_back([&, thread] {
        for (int i = 0; i < kPosts; ++i) this->loop.post([&seen, thread, i] { seen[thread].push_back(i); });
      });
    }
  }
  this->loop.post([this] { this->loop.stop(); });
  this->loop.run();
  for (const auto& posts : seen) {
    ASSERT_EQ(posts.size(), static_cast<std::size_t>(kPosts));
    for (int i = 0; i < kPosts; ++i) EXPECT_EQ(posts[i], i);
  }
}

TYPED_TEST(RunLoopContractTest, AScopedTimerIsCancelledWithItsOwner) {
  { const ScopedTimer timer(this->loop, this->loop.callAfter(1ms, this->note('a'))); }
  this->host.runFor(10ms);
  EXPECT_EQ(this->trace, "");
}

}  // namespace
}  // namespace zal::testing
