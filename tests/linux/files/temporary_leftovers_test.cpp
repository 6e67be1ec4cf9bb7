#include "platform/linux/files/temporary_leftovers.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <string>

#include "platform/linux/files/descriptor.h"
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
  TemporaryLeftoversTest() { fs::create_directory(area); }
  /// Makes an entry last changed that long before now.
  void put(const std::string& name, std::chrono::microseconds age) {
    writeFile(area + "/" + name, "content");
    setAge(name, age);
  }
  void setAge(const std::string& name, std::chrono::microseconds age) {
    const auto moment = (now - age).time_since_epoch();
    const auto seconds = std::chrono::floor<std::chrono::seconds>(moment);
    setTime(area + "/" + name, seconds.count(), std::chrono::nanoseconds(moment - seconds).count());
  }
  TemporaryDirectory directory;
  const std::string area = directory / "area";
  const WallTime now{1714651387251ms};
  const WallTime started = now - 30h;
};

TEST_F(TemporaryLeftoversTest, OnlyEntriesOlderThanADayGo) {
  put("older.zip", 24h + 1us);
  put("a day old.zip", 24h);
  put("fresh.zip", 1s);
  put("from the future.zip", -24h * 365);
  EXPECT_EQ(removeTemporaryLeftovers(area, now, started), 1U);
  EXPECT_EQ(listTree(area), "a day old.zip\nfresh.zip\nfrom the future.zip\n");
}

TEST_F(TemporaryLeftoversTest, OfThisDayAFileGoesThatAnEarlierRunDidNotFinishAndNobodyWrites) {
  for (const char* name : {"unfinished.zip", "written.zip", "kept.zip", "of this run.zip"}) put(name, 1h);
  fs::permissions(area + "/kept.zip", fs::perms::owner_read);
  setAge("of this run.zip", 59min);
  const Descriptor writer(::open((area + "/written.zip").c_str(), O_RDONLY | O_CLOEXEC));
  ASSERT_EQ(::flock(writer.get(), LOCK_EX), 0);
  EXPECT_EQ(removeTemporaryLeftovers(area, now, now - 59min), 1U);
  EXPECT_EQ(listTree(area), "kept.zip\nof this run.zip\nwritten.zip\n");
}

TEST_F(TemporaryLeftoversTest, DirectoriesGoWithAllBelowThemByTheirOwnAge) {
  put("old/deep/file", 1h);
  put("fresh/deep/file", 48h);
  setAge("old", 48h);
  EXPECT_EQ(removeTemporaryLeftovers(area, now, started), 1U);
  EXPECT_EQ(listTree(area), "fresh/\nfresh/deep/\nfresh/deep/file\n");
}

TEST_F(TemporaryLeftoversTest, LinksGoAndWhatTheyLeadToStays) {
  writeFile(directory / "elsewhere/file", "content");
  setTime(directory / "elsewhere/file", 1, 0);
  setTime(directory / "elsewhere", 1, 0);
  fs::create_directory_symlink(directory / "elsewhere", area + "/link");
  setAge("link", 48h);
  put("old/file", 48h);
  fs::create_directory_symlink(directory / "elsewhere", area + "/old/link");
  setAge("old", 48h);
  EXPECT_EQ(removeTemporaryLeftovers(area, now, started), 2U);
  EXPECT_EQ(listTree(directory.path()), "area/\nelsewhere/\nelsewhere/file\n");
}

TEST_F(TemporaryLeftoversTest, AFreshLinkToSomethingOldStays) {
  writeFile(directory / "elsewhere", "content");
  setTime(directory / "elsewhere", 1, 0);
  fs::create_symlink(directory / "elsewhere", area + "/link");
  setAge("link", 1h);
  EXPECT_EQ(removeTemporaryLeftovers(area, now, started), 0U);
}

TEST_F(TemporaryLeftoversTest, AnAreaThatIsALinkIsNotTouched) {
  put("old", 48h);
  fs::create_directory_symlink(area, directory / "prepared");
  EXPECT_EQ(removeTemporaryLeftovers(directory / "prepared", now, started), 0U);
  EXPECT_EQ(listTree(area), "old\n");
}

TEST_F(TemporaryLeftoversTest, AnAreaOfSomebodyElseIsNotTouched) {
  put("old", 48h);
  if (::chown(area.c_str(), 65534, 65534) != 0) GTEST_SKIP() << "only the superuser gives files away";
  EXPECT_EQ(removeTemporaryLeftovers(area, now, started), 0U);
  EXPECT_EQ(listTree(area), "old\n");
}

TEST_F(TemporaryLeftoversTest, AMissingAreaHasNoLeftoversAndIsNotMade) {
  EXPECT_EQ(removeTemporaryLeftovers(directory / "missing", now, started), 0U);
  EXPECT_FALSE(fs::exists(directory / "missing"));
}

class TemporaryLeftoversLaterTest : public TemporaryLeftoversTest {
 protected:
  TemporaryLeftoversLaterTest() { loop.setWall(now); }
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
  put("one", 48h);
  put("two", 48h);
  put("fresh", -1h);
  start(area);
  pass(999ms);
  EXPECT_EQ(listTree(area), "fresh\none\ntwo\n");
  loop.advance(1ms);
  EXPECT_EQ(queues.readyJobs("global.background"), 1U);
  queues.runAll();
  EXPECT_EQ(listTree(area), "fresh\n");
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"notice: Leftovers of earlier runs removed from " + area + ": 2"});
}

TEST_F(TemporaryLeftoversLaterTest, WithoutLeftoversThereIsNoLine) {
  put("fresh", -1h);
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
