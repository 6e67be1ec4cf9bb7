#include "platform/linux/files/temporary_leftovers.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <string>

#include "platform/linux/files/temporary_area.h"
#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;
using namespace std::chrono_literals;

class TemporaryLeftoversTest : public ::testing::Test {
 protected:
  void leave(const std::string& file) { writeFile(area + file, "content"); }

  TemporaryDirectory directory;
  const std::string area = directory / "area";
  const WallTime now{1714651387251ms};
  const std::string beside = "-0123456789abcdef0123456789abcdef";
};

TEST_F(TemporaryLeftoversTest, AllThatNobodyHoldsGoesOfTheAreaAndOfThoseBesideItHoweverFresh) {
  leave("/half.zip");
  leave("/tree/deep/file");
  leave(beside + "/half.zip");
  writeFile(directory / "area-of another", "content");
  EXPECT_EQ(removeTemporaryLeftovers(area, now), 3U);
  EXPECT_EQ(listTree(directory.path()), "area-of another\n");
}

TEST_F(TemporaryLeftoversTest, WhatALivingProcessHoldsStays) {
  TemporaryArea held(area);
  ASSERT_EQ(held.path(), area);
  leave("/half.zip");
  leave(beside + "/half.zip");
  EXPECT_EQ(removeTemporaryLeftovers(area, now), 1U);
  EXPECT_EQ(listTree(directory.path()), "area/\narea/half.zip\n");
}

TEST_F(TemporaryLeftoversTest, AnArchiveThatIsToBeKeptStaysForADay) {
  leave("/half.zip");
  leave("/kept.zip");
  leave("/forgotten.zip");
  for (const char* name : {"/kept.zip", "/forgotten.zip"})
    fs::permissions(area + name, fs::perms::owner_read);
  setTime(area + "/kept.zip", 1714651388 - 86'400, 0);
  setTime(area + "/forgotten.zip", 1714651386 - 86'400, 0);
  EXPECT_EQ(removeTemporaryLeftovers(area, now), 2U);
  EXPECT_EQ(listTree(directory.path()), "area/\narea/kept.zip\n");
}

TEST_F(TemporaryLeftoversTest, LinksGoAndWhatTheyLeadToStays) {
  writeFile(directory / "elsewhere/file", "content");
  leave("/tree/file");
  fs::create_directory_symlink(directory / "elsewhere", area + "/link");
  fs::create_directory_symlink(directory / "elsewhere", area + "/tree/link");
  EXPECT_EQ(removeTemporaryLeftovers(area, now), 2U);
  EXPECT_EQ(listTree(directory.path()), "elsewhere/\nelsewhere/file\n");
}

TEST_F(TemporaryLeftoversTest, AnAreaThatIsALinkIsNotTouched) {
  leave("/left");
  fs::create_directory_symlink(area, directory / "prepared");
  EXPECT_EQ(removeTemporaryLeftovers(directory / "prepared", now), 0U);
  EXPECT_EQ(listTree(area), "left\n");
}

TEST_F(TemporaryLeftoversTest, AnAreaOfSomebodyElseIsNotTouched) {
  leave("/left");
  if (::chown(area.c_str(), 65534, 65534) != 0) GTEST_SKIP() << "only the superuser gives files away";
  EXPECT_EQ(removeTemporaryLeftovers(area, now), 0U);
  EXPECT_EQ(listTree(area), "left\n");
}

TEST_F(TemporaryLeftoversTest, AMissingAreaHasNoLeftoversAndIsNotMade) {
  EXPECT_EQ(removeTemporaryLeftovers(directory / "missing", now), 0U);
  EXPECT_FALSE(fs::exists(directory / "missing"));
}

class TemporaryLeftoversLaterTest : public TemporaryLeftoversTest {
 protected:
  void start(const std::string& place) {
    removeTemporaryLeftoversLater(queues.global(QueuePriority::background), loop, log, place);
  }
  void pass(std::chrono::nanoseconds time) {
    loop.advance(time);
    queues.runAll();
  }
  ManualRunLoop loop;
  ManualWorkQueues queues{loop};
  RecordingAgentLog log;
};

TEST_F(TemporaryLeftoversLaterTest, TheyGoOneSecondAfterTheStartInTheBackgroundWithOneLine) {
  leave("/one");
  leave("/two");
  start(area);
  pass(999ms);
  EXPECT_EQ(listTree(area), "one\ntwo\n");
  loop.advance(1ms);
  EXPECT_EQ(queues.readyJobs("global.background"), 1U);
  queues.runAll();
  EXPECT_FALSE(fs::exists(area));
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"notice: Leftovers of earlier runs removed from " + area + ": 2"});
}

TEST_F(TemporaryLeftoversLaterTest, WithoutLeftoversThereIsNoLine) {
  fs::create_directory(area);
  start(area);
  pass(1s);
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(TemporaryLeftoversLaterTest, WithoutAnAreaThereIsNothingToQueue) {
  start(directory / "missing");
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

}  // namespace
}  // namespace zal::testing
