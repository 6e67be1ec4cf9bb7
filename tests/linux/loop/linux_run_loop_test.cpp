#include "platform/linux/loop/linux_run_loop.h"

#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>

#include <string>
#include <thread>
#include <vector>

#include <asio/post.hpp>

namespace zal {
namespace {

using namespace std::chrono_literals;

long contextSwitches() {
  rusage usage{};
  ::getrusage(RUSAGE_THREAD, &usage);
  return usage.ru_nvcsw;
}

class LinuxRunLoopTest : public ::testing::Test {
 protected:
  void runFor(std::chrono::nanoseconds duration) {
    loop.callAfter(duration, [this] { loop.stop(); });
    loop.run();
  }
  LinuxRunLoop loop;
};

TEST_F(LinuxRunLoopTest, DoesNotWakeUpWhileNoTimerIsDue) {
  runFor(1ms);
  loop.callAfter(1h, [] {});
  const TimerId cancelled = loop.callAfter(20ms, [] {});
  long during = -1;
  loop.post([&] {
    loop.cancel(cancelled);
    during = contextSwitches();
  });
  runFor(100ms);
  // One wait, into which no other thread broke in: the sleep until the end of the run.
  EXPECT_EQ(contextSwitches() - during, 1);
}

TEST_F(LinuxRunLoopTest, SleepObserversRunOnceForEachSleep) {
  int sleeps = 0;
  loop.addSleepObserver([&] { ++sleeps; });
  loop.callAfter(50ms, [this] { loop.callAfter(100ms, [this] { loop.stop(); }); });
  loop.run();
  // Before the first timer, after it, and at most once more after a handler that only woke the loop.
  EXPECT_GE(sleeps, 2);
  EXPECT_LE(sleeps, 4);
}

TEST_F(LinuxRunLoopTest, MissedBeatsAreNotMadeUpAndTheGridStays) {
  const SteadyTime start = std::chrono::steady_clock::now();
  std::vector<std::chrono::nanoseconds> beats;
  loop.callEvery(20ms, [&] {
    beats.push_back(std::chrono::steady_clock::now() - start);
    // The first beat keeps the thread busy over the next two instants of the grid.
    while (beats.size() == 1 && std::chrono::steady_clock::now() - start < 70ms) {
    }
    if (beats.size() == 2) loop.stop();
  });
  loop.run();
  ASSERT_EQ(beats.size(), 2U);
  EXPECT_GE(beats[1], 80ms);
}

TEST_F(LinuxRunLoopTest, AFloodOfHandlersDoesNotHoldTimersBack) {
  bool fired = false;
  std::function<void()> flood = [&] {
    if (!fired) loop.post(flood);
  };
  loop.post(flood);
  loop.callAfter(2ms, [&] {
    fired = true;
    loop.stop();
  });
  loop.run();
  EXPECT_TRUE(fired);
}

TEST_F(LinuxRunLoopTest, TheLongestDelayNeitherOverflowsNorFires) {
  std::string trace;
  loop.callAfter(std::chrono::nanoseconds::max(), [&] { trace += 'x'; });
  for (char name = 'a'; name <= 'h'; ++name) loop.callAfter(0ns, [&trace, name] { trace += name; });
  runFor(5ms);
  EXPECT_EQ(trace, "abcdefgh");
}

TEST_F(LinuxRunLoopTest, StopFromAnotherThreadEndsTheWait) {
  std::jthread other([this] { loop.stop(); });
  loop.run();
}

TEST_F(LinuxRunLoopTest, APostFromAnotherThreadEndsTheWait) {
  std::jthread other([this] { loop.post([this] { loop.stop(); }); });
  loop.run();
}

TEST_F(LinuxRunLoopTest, HandlersOfTheContextRunOnTheLoop) {
  std::thread::id where;
  asio::post(loop.context(), [&] {
    where = std::this_thread::get_id();
    loop.stop();
  });
  loop.run();
  EXPECT_EQ(where, std::this_thread::get_id());
}

TEST_F(LinuxRunLoopTest, ASignalRunsItsTaskOnTheLoopEachTime) {
  int hangups = 0;
  loop.onSignal(SIGHUP, [&] {
    if (++hangups == 2) loop.stop();
    ::raise(SIGHUP);
  });
  ::raise(SIGHUP);
  EXPECT_EQ(hangups, 0);
  loop.run();
  EXPECT_EQ(hangups, 2);
}

TEST_F(LinuxRunLoopTest, ASignalThatCannotBeCaughtIsRefused) {
  EXPECT_THROW(loop.onSignal(SIGKILL, [] {}), std::system_error);
}

TEST_F(LinuxRunLoopTest, EndsWithTasksAndTimersStillPending) {
  auto alive = std::make_shared<int>(0);
  {
    LinuxRunLoop other;
    other.post([alive] {});
    other.callAfter(1h, [alive] {});
    EXPECT_EQ(alive.use_count(), 3);
  }
  EXPECT_EQ(alive.use_count(), 1);
}

#ifndef NDEBUG
TEST(LinuxRunLoopDeathTest, ATimerMadeOnAnotherThreadEndsTheProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_DEATH(
      {
        LinuxRunLoop loop;
        std::jthread([&] { loop.callAfter(1ms, [] {}); }).join();
      },
      "LinuxRunLoop belongs to thread .* but .* was called on thread");
}
#endif

}  // namespace
}  // namespace zal
