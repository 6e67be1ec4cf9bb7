#include "dump/disk_budget_keeper.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/fake_platform.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

/// A disk of 100 MiB, of which ten may be kept.
class DiskBudgetKeeperTest : public ::testing::Test {
 protected:
  static constexpr std::uint64_t kMebibyte = 1U << 20U;

  DiskBudgetKeeperTest() {
    host.host.setWall(WallTime{1714651387251ms});
    host.keptStore.disk = {100 * kMebibyte, 80 * kMebibyte};
  }
  void keep(const std::string& path, const std::string& type, std::uint64_t mebibytes, int daysOld) {
    KeptItem item;
    item.path = path;
    item.type = type;
    item.bytes = mebibytes * kMebibyte;
    item.changed = host.host.wallNow() - std::chrono::hours(24 * daysOld);
    host.keptStore.kept.push_back(item);
  }
  void look() {
    keeper().look();
    host.queues.runAll();
  }
  DiskBudgetKeeper& keeper() {
    if (!_keeper) _keeper = std::make_unique<DiskBudgetKeeper>(host.platform);
    return *_keeper;
  }
  [[nodiscard]] std::vector<std::string> left() const {
    std::vector<std::string> paths;
    for (const KeptItem& item : host.keptStore.kept) paths.push_back(item.path);
    return paths;
  }

  testing::FakePlatform host;

 private:
  std::unique_ptr<DiskBudgetKeeper> _keeper;
};

TEST_F(DiskBudgetKeeperTest, ItLooksInTheBackgroundOnceHoweverOftenItIsAsked) {
  keeper().look();
  keeper().look();
  EXPECT_EQ(host.queues.readyJobs("global.background"), 1U);
  EXPECT_EQ(host.keptStore.looks, 0);
  host.queues.runAll();
  EXPECT_EQ(host.keptStore.looks, 1);
  look();
  EXPECT_EQ(host.keptStore.looks, 2);
}

TEST_F(DiskBudgetKeeperTest, AStartLooksThreeSecondsLater) {
  keeper().lookLater();
  host.host.advance(2999ms);
  host.queues.runAll();
  EXPECT_EQ(host.keptStore.looks, 0);
  host.host.advance(1ms);
  host.queues.runAll();
  EXPECT_EQ(host.keptStore.looks, 1);
}

TEST_F(DiskBudgetKeeperTest, WithinTheBudgetNothingGoesAndNoLogIsReadForFailures) {
  keep("/a", "Vistel", 10, 1);
  look();
  EXPECT_THAT(left(), ElementsAre("/a"));
  EXPECT_EQ(host.keptStore.failureLooks, 0);
  EXPECT_THAT(host.agentLog.lines, IsEmpty());
}

TEST_F(DiskBudgetKeeperTest, EachEvictionIsOneLineThatSaysWhatWentAndWhy) {
  keep("/old\n", "Vi\nstel", 4, 3);
  keep("/new", "Vi\nstel", 8, 1);
  look();
  EXPECT_THAT(left(), ElementsAre("/new"));
  ASSERT_EQ(host.agentLog.lines.size(), 1U);
  EXPECT_THAT(host.agentLog.lines[0],
              HasSubstr("Evicted /old? (session of Vi?stel, 4.0 MiB, of 2024-04-29 at "));
  EXPECT_THAT(host.agentLog.lines[0], HasSubstr("): more than 10.0 MiB are kept"));
}

TEST_F(DiskBudgetKeeperTest, OnAFullDiskTheLineSaysSo) {
  keep("/old", "Vistel", 4, 3);
  host.keptStore.disk.free = 14 * kMebibyte;
  look();
  EXPECT_THAT(left(), IsEmpty());
  EXPECT_THAT(host.agentLog.lines, ElementsAre(HasSubstr(": less than 15.0 MiB of the disk are free")));
}

TEST_F(DiskBudgetKeeperTest, FailedCallsAreSparedAsLongAsThereAreOthers) {
  keep("/failed", "Vistel", 5, 9);
  keep("/old", "Vistel", 5, 3);
  keep("/new", "Vistel", 5, 1);
  host.keptStore.failedCalls = {"/failed"};
  look();
  EXPECT_THAT(left(), ElementsAre("/failed", "/new"));
}

TEST_F(DiskBudgetKeeperTest, WhatCannotBeRemovedIsToldOnceAndAnotherGoesInItsPlace) {
  keep("/stubborn", "Vistel", 5, 9);
  keep("/old", "Vistel", 5, 3);
  keep("/new", "Vistel", 5, 1);
  host.keptStore.refusals["/stubborn"] = std::make_error_code(std::errc::permission_denied);
  look();
  EXPECT_THAT(left(), ElementsAre("/stubborn", "/new"));
  EXPECT_THAT(host.agentLog.lines, ElementsAre("warning: Could not evict /stubborn: Permission denied",
                                               HasSubstr("Evicted /old")));
  keep("/newest", "Vistel", 1, 1);
  look();
  EXPECT_THAT(left(), ElementsAre("/stubborn", "/newest"));
  EXPECT_EQ(host.agentLog.lines.size(), 3U);
}

TEST_F(DiskBudgetKeeperTest, WhatIsInUseByThenStaysWithoutAWord) {
  keep("/read", "Vistel", 15, 9);
  host.keptStore.refusals["/read"] = std::make_error_code(std::errc::device_or_resource_busy);
  look();
  EXPECT_THAT(left(), ElementsAre("/read"));
  EXPECT_THAT(host.agentLog.lines, IsEmpty());
}

TEST_F(DiskBudgetKeeperTest, WhatIsHeldStaysItsArchiveTooUntilItIsLetGo) {
  const std::string dump = host.home / "dump";
  keep(dump, "Vistel", 15, 9);
  keep(dump + ".zip", "Vistel", 15, 9);
  keep(dump + " (b).zip", "Vistel", 15, 9);
  auto held = keeper().hold(dump);
  look();
  EXPECT_THAT(left(), ElementsAre(dump, dump + ".zip"));
  held.reset();
  look();
  EXPECT_THAT(left(), IsEmpty());
}

TEST_F(DiskBudgetKeeperTest, ADumpIsAdmittedWhereItsLikeHaveRoom) {
  keep("/before", "Vistel", 2, 1);
  look();
  EXPECT_TRUE(keeper().admits("Vistel"));
  EXPECT_EQ(host.queues.readyJobs("global.background"), 0U);
  host.keptStore.disk.free =
      16 * kMebibyte;  // one and what may go more than shall stay free; four are expected
  EXPECT_FALSE(keeper().admits("Vistel"));
}

TEST_F(DiskBudgetKeeperTest, RoomForADumpIsMadeWhileItBegins) {
  keep("/old", "Nexa", 5, 3);
  keep("/before", "Vistel", 3, 1);
  look();
  EXPECT_TRUE(keeper().admits("Vistel"));  // six more: fourteen, and ten may be kept
  EXPECT_EQ(host.queues.readyJobs("global.background"), 1U);
  host.queues.runAll();
  EXPECT_THAT(left(), ElementsAre("/before"));
  look();  // the room is asked for no longer
  EXPECT_THAT(left(), ElementsAre("/before"));
}

TEST_F(DiskBudgetKeeperTest, ADumpOfAKnownSizeThatNoEvictionMakesRoomForIsNotAdmittedAndEvictsNothing) {
  keep("/before", "Vistel", 6, 1);
  look();
  EXPECT_FALSE(keeper().admits("Vistel"));
  host.queues.runAll();
  EXPECT_THAT(left(), ElementsAre("/before"));
}

TEST_F(DiskBudgetKeeperTest, BeforeTheFirstLookTheRoomOnTheDiskDecidesAlone) {
  EXPECT_TRUE(keeper().admits("Vistel"));
  host.keptStore.disk.free = 19 * kMebibyte;
  EXPECT_FALSE(keeper().admits("Vistel"));
  host.keptStore.disk = {};  // nobody can tell
  EXPECT_TRUE(keeper().admits("Vistel"));
}

}  // namespace
}  // namespace zal
