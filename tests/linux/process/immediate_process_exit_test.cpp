#include "platform/linux/process/immediate_process_exit.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <stdexcept>

namespace zal {
namespace {

void say(const char* text) { std::fputs(text, stderr); }

struct SaysGoodbyeWhenDestroyed {
  ~SaysGoodbyeWhenDestroyed() { say("destroyed"); }
};

TEST(ImmediateProcessExitDeathTest, RunsTheLastTaskAndEndsWithTheStatus) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(ImmediateProcessExit([] { say("flushed"); }).exit(0), ::testing::ExitedWithCode(0),
              "^flushed$");
  EXPECT_EXIT(ImmediateProcessExit(nullptr).exit(3), ::testing::ExitedWithCode(3), "^$");
}

TEST(ImmediateProcessExitDeathTest, RunsNoDestructors) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(
      {
        static const SaysGoodbyeWhenDestroyed atTheEnd;
        std::atexit([] { say("atexit"); });
        ImmediateProcessExit([] { say("flushed"); }).exit(0);
      },
      ::testing::ExitedWithCode(0), "^flushed$");
}

TEST(ImmediateProcessExitDeathTest, EndsEvenWhenTheLastTaskThrows) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(ImmediateProcessExit([] { throw std::runtime_error("disk is full"); }).exit(0),
              ::testing::ExitedWithCode(0), "");
}

TEST(ImmediateProcessExitDeathTest, ALastTaskThatAsksForTheEndGetsIt) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(
      {
        ProcessExit* again = nullptr;
        ImmediateProcessExit processExit([&] { again->exit(4); });
        again = &processExit;
        processExit.exit(0);
      },
      ::testing::ExitedWithCode(4), "");
}

}  // namespace
}  // namespace zal
