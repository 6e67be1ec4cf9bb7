#include "platform/disk_budget.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <limits>

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// A disk of 1000 bytes, all free but for what the items take, and no rule but those that a test sets.
class DiskBudgetTest : public ::testing::Test {
 protected:
  static constexpr WallTime kNow{1714651387s};

  KeptItem& add(const std::string& path, const std::string& type, std::uint64_t bytes, int daysOld) {
    KeptItem item;
    item.path = path;
    item.type = type;
    item.bytes = bytes;
    item.changed = kNow - std::chrono::hours(24 * daysOld);
    items.push_back(item);
    return items.back();
  }
  [[nodiscard]] DiskRoom room() const {
    std::uint64_t used = 0;
    for (const KeptItem& item : items) used += item.isElsewhere ? 0 : item.bytes;
    return {1000, 1000 - used - usedByOthers};
  }
  /// "path: reason" of each that goes, in order.
  [[nodiscard]] std::vector<std::string> goes(std::uint64_t reserve = 0) const {
    std::vector<std::string> lines;
    for (const Eviction& eviction : planEvictions(items, limits, room(), kNow, reserve)) {
      lines.push_back(items[eviction.item].path + ": " + std::string(evictionReasonText(eviction.reason)));
    }
    return lines;
  }

  std::vector<KeptItem> items;
  DiskLimits limits;
  std::uint64_t usedByOthers = 0;
};

TEST_F(DiskBudgetTest, NothingGoesUpToTheLimitAndTheOldestGoesAByteBeyondIt) {
  add("new", "Vistel", 100, 1);
  add("old", "Vistel", 100, 3);
  add("middle", "Vistel", 100, 2);
  limits.most = 300;
  EXPECT_THAT(goes(), IsEmpty());
  limits.most = 299;
  EXPECT_THAT(goes(), ElementsAre("old: over budget"));
  limits.most = 199;
  EXPECT_THAT(goes(), ElementsAre("old: over budget", "middle: over budget"));
}

TEST_F(DiskBudgetTest, OfTheSameAgeTheFirstPathGoesFirst) {
  add("b", "Vistel", 100, 1);
  add("a", "Vistel", 100, 1);
  limits.most = 100;
  EXPECT_THAT(goes(), ElementsAre("a: over budget"));
}

TEST_F(DiskBudgetTest, AChattyTypeEvictsItselfHoweverOldTheOthersAre) {
  add("quiet", "Nexa", 50, 300);
  for (int i = 0; i < 5; ++i) add("chatty " + std::to_string(i), "Vistel", 100, 5 - i);
  limits.most = 350;
  EXPECT_THAT(goes(), ElementsAre("chatty 0: over budget", "chatty 1: over budget"));
}

TEST_F(DiskBudgetTest, TypesThatTakeTheSameGoByTurns) {
  add("a old", "A", 100, 4);
  add("a new", "A", 100, 3);
  add("b old", "B", 100, 2);
  add("b new", "B", 100, 1);
  limits.most = 200;
  EXPECT_THAT(goes(), ElementsAre("a old: over budget", "b old: over budget"));
}

TEST_F(DiskBudgetTest, FailedCallsGoLast) {
  add("failed", "Vistel", 100, 9).hasFailed = true;
  add("old", "Vistel", 100, 2);
  add("new", "Vistel", 100, 1);
  limits.most = 200;
  EXPECT_THAT(goes(), ElementsAre("old: over budget"));
  limits.most = 50;
  EXPECT_THAT(goes(), ElementsAre("old: over budget", "new: over budget", "failed: over budget"));
}

TEST_F(DiskBudgetTest, TheFailedCallsOfATypeGoAfterThoseOfAnotherThatTakesTooMuchAsWell) {
  add("a failed", "A", 300, 9).hasFailed = true;
  add("b", "B", 250, 1);
  add("c", "C", 10, 5);
  limits.most = 330;
  EXPECT_THAT(goes(), ElementsAre("b: over budget"));
}

TEST_F(DiskBudgetTest, FailedCallsOfAChattyTypeGoBeforeAnythingOfATypeWithinItsShare) {
  add("quiet", "Nexa", 50, 300);
  for (int i = 0; i < 4; ++i) add("failed " + std::to_string(i), "Vistel", 100, 5 - i).hasFailed = true;
  limits.most = 250;
  EXPECT_THAT(goes(), ElementsAre("failed 0: over budget", "failed 1: over budget"));
}

TEST_F(DiskBudgetTest, WhatIsInUseStaysAndOthersGoInItsPlace) {
  add("linked", "Vistel", 200, 9).inUse = "linked as the latest";
  add("old", "Vistel", 100, 2);
  add("quiet", "Nexa", 100, 300);
  limits.most = 250;
  EXPECT_THAT(goes(), ElementsAre("old: over budget", "quiet: over budget"));
}

TEST_F(DiskBudgetTest, ADirectoryStaysTenMinutesAfterItsLastChangeInEitherDirection) {
  KeptItem& directory = add("directory", "Vistel", 100, 0);
  directory.isDirectory = true;
  limits.most = 0;
  for (const auto age :
       {std::chrono::microseconds(10min) - 1us, 0us, 1us - std::chrono::microseconds(10min)}) {
    directory.changed = kNow - age;
    EXPECT_THAT(goes(), IsEmpty()) << age.count();
  }
  directory.changed = kNow - 10min;
  EXPECT_THAT(goes(), ElementsAre("directory: over budget"));
}

TEST_F(DiskBudgetTest, AStubCountsAndStaysForAYear) {
  KeptItem& stub = add("stub", "Vistel", 100, 0);
  stub.kind = KeptKind::stub;
  limits.most = 0;
  stub.changed = kNow - std::chrono::hours(365 * 24);
  EXPECT_THAT(goes(), IsEmpty());
  stub.changed -= 1us;
  EXPECT_THAT(goes(), ElementsAre("stub: expired"));
  limits.most = 5000;
  EXPECT_THAT(goes(), ElementsAre("stub: expired"));
}

TEST_F(DiskBudgetTest, LeftoversGoWithinTheBudgetTooAndMakeRoomForTheRest) {
  add("old", "Vistel", 100, 9);
  KeptItem& leftover = add("leftover", "", 100, 1);
  leftover.kind = KeptKind::temporary;
  leftover.isLeftover = true;
  limits.most = 100;
  EXPECT_THAT(goes(), ElementsAre("leftover: leftover"));
  items[1].inUse = "being written";
  EXPECT_THAT(goes(), ElementsAre("old: over budget"));
}

TEST_F(DiskBudgetTest, RecordsAreATypeOfTheirOwnWhateverSessionsAreCalled) {
  add("nameless", "", 100, 1);
  for (int i = 0; i < 3; ++i) add("record " + std::to_string(i), "", 100, 3 - i).kind = KeptKind::record;
  limits.most = 250;
  EXPECT_THAT(goes(), ElementsAre("record 0: over budget", "record 1: over budget"));
}

TEST_F(DiskBudgetTest, AFullDiskEvictsWhatLiesOnIt) {
  add("elsewhere", "", 100, 9).isElsewhere = true;
  items[0].kind = KeptKind::record;
  add("here", "Vistel", 100, 1);
  limits.keepFree = 150;
  usedByOthers = 750;
  EXPECT_THAT(goes(), IsEmpty());
  usedByOthers = 751;
  EXPECT_THAT(goes(), ElementsAre("here: disk too full"));
  usedByOthers = 900;  // more than can be made good
  EXPECT_THAT(goes(), ElementsAre("here: disk too full"));
  limits.most = 50;
  EXPECT_THAT(goes(), ElementsAre("elsewhere: over budget", "here: over budget"));
}

TEST_F(DiskBudgetTest, RoomIsMadeAheadForWhatIsAboutToCome) {
  add("old", "Vistel", 100, 2);
  add("new", "Vistel", 100, 1);
  limits.most = 300;
  EXPECT_THAT(goes(100), IsEmpty());
  EXPECT_THAT(goes(101), ElementsAre("old: over budget"));
  limits.most = std::nullopt;
  limits.keepFree = 700;
  EXPECT_THAT(goes(100), IsEmpty());
  EXPECT_THAT(goes(101), ElementsAre("old: disk too full"));
}

TEST_F(DiskBudgetTest, ABudgetOfNothingEvictsAllThatMayGoAndAHugeOneNothing) {
  add("a", "A", 100, 2);
  add("b", "B", 100, 1);
  add("empty", "B", 0, 1);  // its going would not help
  limits.most = 0;
  EXPECT_THAT(goes(), ElementsAre("a: over budget", "b: over budget"));
  limits.most = std::numeric_limits<std::uint64_t>::max();
  EXPECT_THAT(goes(800), IsEmpty());
}

TEST_F(DiskBudgetTest, WithoutItemsNothingGoes) {
  limits = {0, 1000};
  EXPECT_THAT(goes(5), IsEmpty());
}

TEST(DiskLimitsTest, TheSizeGoesBeforeTheShareAndZerosAreNoLimits) {
  const DiskRoom room{1000, 500};
  EXPECT_EQ(diskLimits({}, room).most, 100U);
  EXPECT_EQ(diskLimits({}, room).keepFree, 150U);
  EXPECT_EQ(diskLimits({.size = 7, .share = 50}, room).most, 7U);
  EXPECT_EQ(diskLimits({.share = 0, .keepFree = 0}, room).most, std::nullopt);
  EXPECT_EQ(diskLimits({.share = 0, .keepFree = 0}, room).keepFree, 0U);
}

TEST(DiskLimitsTest, ADiskThatCannotBeToldSetsNoLimits) {
  EXPECT_EQ(diskLimits({}, {}).most, std::nullopt);
  EXPECT_EQ(diskLimits({}, {}).keepFree, 0U);
  EXPECT_EQ(diskLimits({.size = 7}, {}).most, 7U);
  EXPECT_THAT(planEvictions(std::vector<KeptItem>(1), diskLimits({}, {}), {}, WallTime{}, 100), IsEmpty());
}

TEST(DiskLimitsTest, ThePercentageOfAHugeDiskDoesNotOverflow) {
  const DiskRoom room{std::numeric_limits<std::uint64_t>::max(), 0};
  EXPECT_EQ(diskLimits({.keepFree = 100}, room).keepFree, room.total);
}

TEST_F(DiskBudgetTest, ThereIsRoomForADumpWhenWhatMayGoMakesIt) {
  add("old", "Vistel", 100, 2);
  add("linked", "Vistel", 100, 2).inUse = "linked as the latest";
  const DiskUse use = diskUse(items, kNow);
  limits.most = 300;
  EXPECT_TRUE(hasRoomFor(200, limits, room(), use));
  EXPECT_FALSE(hasRoomFor(201, limits, room(), use));
  limits = {std::nullopt, 150};
  EXPECT_TRUE(hasRoomFor(750, limits, room(), use));
  EXPECT_FALSE(hasRoomFor(751, limits, room(), use));
  EXPECT_TRUE(hasRoomFor(751, {}, {}, use));
}

TEST(ExpectedDumpTest, ItIsTwiceTheLargestOfItsTypeAndSomeMebibytesWhereThereWasNone) {
  EXPECT_EQ(expectedDump(300, {100, 0}), 600U);
  EXPECT_EQ(expectedDump(0, {}), 8'388'608U);
  EXPECT_EQ(expectedDump(0, {1000, 0}), 500U);
}

}  // namespace
}  // namespace zal
