#include <fcntl.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>

#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr int kNotPermitted = 77;

/// This process, which has one thread, goes on in a time namespace whose clocks show so much more. It is
/// what a host's sleep does to the clock since boot.
void jump(std::chrono::seconds monotonic, std::chrono::seconds sinceBoot) {
  if (::unshare(CLONE_NEWTIME) != 0) ::_exit(kNotPermitted);
  std::ofstream offsets("/proc/self/timens_offsets");
  offsets << "monotonic " << monotonic.count() << " 0\nboottime " << sinceBoot.count() << " 0\n"
          << std::flush;
  const int target = ::open("/proc/self/ns/time_for_children", O_RDONLY | O_CLOEXEC);
  if (!offsets || target < 0 || ::setns(target, CLONE_NEWTIME) != 0) ::_exit(kNotPermitted);
  ::close(target);
}

/// Of the body in a process of its own.
int statusOf(const std::function<int()>& body) {
  const pid_t child = ::fork();
  if (child == 0) ::_exit(body());
  int status = 0;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

#define ZAL_SKIP_WHERE_CLOCKS_STAND(status) \
  if ((status) == kNotPermitted) GTEST_SKIP() << "this process may not have clocks of its own"

TEST(TimeJumpTest, WhatFellDueWhileTheHostSleptFiresWhenItWakes) {
  const int status = statusOf([] {
    LinuxRunLoop loop;
    int fired = 0;
    loop.callAfter(6min, [&] { ++fired; });
    loop.callEvery(5s, [&] { fired += 10; });
    loop.post([] { jump(0s, 1h); });
    loop.callAfter(1h + 1ms, [&] { loop.stop(); });
    loop.run();
    return fired;
  });
  ZAL_SKIP_WHERE_CLOCKS_STAND(status);
  EXPECT_EQ(status, 11) << "one for the timer, ten for each beat";
}

TEST(TimeJumpTest, TheClockThatStandsStillInSleepDecidesNothing) {
  const int status = statusOf([] {
    LinuxRunLoop loop;
    int fired = 0;
    loop.callAfter(6min, [&] { ++fired; });
    loop.post([] { jump(1h, 0s); });
    loop.callAfter(5ms, [&] { loop.stop(); });
    loop.run();
    return fired;
  });
  ZAL_SKIP_WHERE_CLOCKS_STAND(status);
  EXPECT_EQ(status, 0);
}

TEST(TimeJumpTest, BothSteadyClocksCountTheSleepAndTheWallClockIsItsOwn) {
  const int status = statusOf([] {
    const LinuxClock clock;
    const SteadyTime before = clock.steadyNow();
    (void)clock.steadyNowRoughly();
    const WallTime wall = clock.wallNow();
    jump(0s, 1h);
    if (clock.steadyNow() - before < 1h) return 1;
    // The kernel's next tick at the latest.
    while (clock.steadyNowRoughly() - before < 1h) {
      if (clock.steadyNow() - before > 1h + 10s) return 2;
    }
    return clock.wallNow() - wall > 30min ? 3 : 0;
  });
  ZAL_SKIP_WHERE_CLOCKS_STAND(status);
  EXPECT_EQ(status, 0);
}

TEST(TimeJumpTest, TheAlarmOfTheLoopCountsTheSleepToo) {
  const LinuxRunLoop loop;
  std::string clocks;
  for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fdinfo")) {
    std::ifstream file(entry.path());
    std::string line;
    while (std::getline(file, line)) {
      if (line.starts_with("clockid: ")) clocks += line.substr(9) + ";";
    }
  }
  // 7 is CLOCK_BOOTTIME. The library has a timer of its own, on 1, which nothing here arms.
  EXPECT_NE(clocks.find("7;"), std::string::npos) << clocks;
}

TEST(TimeJumpTest, AZoneSetDuringTheRunChangesNeitherThisAnswerNorTheNext) {
  EXPECT_EXIT(
      {
        ::setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);
        const LinuxClock clock;
        ::setenv("TZ", "EAST-5", 1);
        const auto noon = clock.momentOf({2024, 7, 15, 12, 0, 0, 0});
        ::_exit(noon == WallTime{1721037600s} && clock.localTime(*noon).hour == 12 ? 0 : 1);
      },
      ::testing::ExitedWithCode(0), "");
}

}  // namespace
}  // namespace zal
