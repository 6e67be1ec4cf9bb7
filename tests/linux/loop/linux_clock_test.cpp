#include "platform/linux/loop/linux_clock.h"

#include <gtest/gtest.h>
#include <time.h>

#include <clocale>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <thread>

namespace zal {
namespace {

using namespace std::chrono_literals;

/// Runs with TZ set; POSIX forms, so that no zone files are needed.
class LinuxClockTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (const char* zone = std::getenv("TZ")) _before = zone;
  }
  void TearDown() override { inZone(_before); }
  static LinuxClock inZone(const std::string& zone) {
    if (zone.empty()) {
      ::unsetenv("TZ");
    } else {
      ::setenv("TZ", zone.c_str(), 1);
    }
    return LinuxClock();
  }
  static std::string text(const LocalTime& t) {
    char buffer[64];
    std::snprintf(buffer, sizeof buffer, "%04d-%02d-%02d %02d:%02d:%02d.%03d", t.year, t.month, t.day, t.hour,
                  t.minute, t.second, t.millisecond);
    return buffer;
  }

 private:
  std::string _before;
};

TEST_F(LinuxClockTest, TheRoughTimeIsTheSteadyOneOfAMomentAgo) {
  const LinuxClock clock;
  const SteadyTime before = clock.steadyNow();
  const SteadyTime roughly = clock.steadyNowRoughly();
  EXPECT_LE(roughly, clock.steadyNow());
  EXPECT_GE(roughly, before - std::chrono::milliseconds(11));
}

TEST_F(LinuxClockTest, TakesAMomentApartInTheLocalZone) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  EXPECT_EQ(text(clock.localTime(WallTime{1714651387251999us})), "2024-05-02 14:03:07.251");
}

TEST_F(LinuxClockTest, FollowsSummerTimeToTheMicrosecond) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  EXPECT_EQ(text(clock.localTime(WallTime{1711846799999999us})), "2024-03-31 01:59:59.999");
  EXPECT_EQ(text(clock.localTime(WallTime{1711846800000000us})), "2024-03-31 03:00:00.000");
}

TEST_F(LinuxClockTest, MomentsBefore1970CountTheirFractionForwards) {
  const LinuxClock clock = inZone("UTC0");
  EXPECT_EQ(text(clock.localTime(WallTime{-1us})), "1969-12-31 23:59:59.999");
  EXPECT_EQ(text(clock.localTime(WallTime{-1000000us})), "1969-12-31 23:59:59.000");
}

TEST_F(LinuxClockTest, KnowsTheFirstAndTheLastSecondThatFourDigitsCanShow) {
  const LinuxClock clock = inZone("UTC0");
  EXPECT_EQ(text(clock.localTime(wallTimeFromSeconds(-1e300))), "0001-01-01 00:00:00.000");
  EXPECT_EQ(text(clock.localTime(wallTimeFromSeconds(1e300))), "9999-12-31 23:59:59.000");
}

TEST_F(LinuxClockTest, AnswersFromTheZoneOfTheLatestClock) {
  const WallTime moment{1714651387251000us};
  EXPECT_EQ(text(inZone("UTC0").localTime(moment)), "2024-05-02 12:03:07.251");
  EXPECT_EQ(text(inZone("EAST-5").localTime(moment)), "2024-05-02 17:03:07.251");
}

TEST_F(LinuxClockTest, SecondsAskedForInTurnDoNotMixUp) {
  const LinuxClock clock = inZone("UTC0");
  for (int round = 0; round < 3; ++round) {
    EXPECT_EQ(text(clock.localTime(WallTime{5s + 1ms})), "1970-01-01 00:00:05.001");
    EXPECT_EQ(text(clock.localTime(WallTime{6s + 2ms})), "1970-01-01 00:00:06.002");
    EXPECT_EQ(text(clock.localTime(WallTime{6s + 3ms})), "1970-01-01 00:00:06.003");
  }
}

TEST_F(LinuxClockTest, EveryThreadGetsTheSameAnswer) {
  const LinuxClock clock = inZone("EAST-5");
  std::string here = text(clock.localTime(WallTime{0us})), there;
  std::jthread([&] { there = text(clock.localTime(WallTime{0us})); }).join();
  EXPECT_EQ(here, there);
}

TEST_F(LinuxClockTest, AMomentPutTogetherAgainIsTheSame) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  // Winter, summer, the seconds around both changes of 2024, before 1970, and four digits of years.
  for (const std::int64_t second :
       {1704067200LL, 1714651387LL, 1711846799LL, 1711846800LL, 1729987199LL, 1729994400LL, -1LL, 0LL,
        -86400LL * 365 * 100, 253402214400LL, -62135510400LL}) {
    const WallTime moment{std::chrono::seconds{second} + 251ms};
    EXPECT_EQ(clock.momentOf(clock.localTime(moment)), moment) << second;
  }
}

TEST_F(LinuxClockTest, TheZoneOfADateDecidesNotThatOfToday) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  EXPECT_EQ(clock.momentOf({2024, 1, 15, 12, 0, 0, 0}), WallTime{1705316400s});  // 11:00 UTC
  EXPECT_EQ(clock.momentOf({2024, 7, 15, 12, 0, 0, 0}), WallTime{1721037600s});  // 10:00 UTC
}

TEST_F(LinuxClockTest, ASkippedOrRepeatedTimeIsOneOfTheMomentsAroundIt) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  const auto skipped = clock.momentOf({2024, 3, 31, 2, 30, 0, 0});
  EXPECT_TRUE(skipped == WallTime{1711845000s} || skipped == WallTime{1711848600s});  // 01:30, 03:30
  const auto repeated = clock.momentOf({2024, 10, 27, 2, 30, 0, 0});
  EXPECT_TRUE(repeated == WallTime{1729989000s} || repeated == WallTime{1729992600s});
}

TEST_F(LinuxClockTest, ThereIsNoMomentForAnImpossibleDateOrTime) {
  const LinuxClock clock = inZone("CET-1CEST,M3.5.0,M10.5.0/3");
  for (const LocalTime& time : {LocalTime{2023, 2, 29, 12, 0, 0, 0}, LocalTime{2024, 4, 31, 12, 0, 0, 0},
                                LocalTime{2024, 13, 1, 12, 0, 0, 0}, LocalTime{2024, 0, 1, 12, 0, 0, 0},
                                LocalTime{2024, 1, 0, 12, 0, 0, 0}, LocalTime{2024, 1, 1, 24, 0, 0, 0},
                                LocalTime{2024, 1, 1, 12, 60, 0, 0}, LocalTime{2024, 1, 1, 12, 0, 61, 0},
                                LocalTime{2024, 1, 1, -1, 0, 0, 0}}) {
    EXPECT_EQ(clock.momentOf(time), std::nullopt) << text(time);
  }
  EXPECT_TRUE(clock.momentOf({2024, 2, 29, 23, 59, 60, 0}));  // a leap second may be written down
  EXPECT_TRUE(clock.momentOf({9999, 12, 31, 23, 59, 59, 0}));
  EXPECT_EQ(clock.momentOf({9999, 12, 31, 23, 59, 60, 0}),
            std::nullopt);  // would be in a year of five digits
}

TEST_F(LinuxClockTest, TheLastSecondBefore1970IsAMomentLikeAnyOther) {
  const LinuxClock clock = inZone("UTC0");
  EXPECT_EQ(clock.momentOf({1969, 12, 31, 23, 59, 59, 0}), WallTime{-1s});
}

TEST_F(LinuxClockTest, NamesTheZoneAsItIsNow) {
  EXPECT_EQ(inZone("EAST-5").zoneAbbreviation(), "EAST");
  EXPECT_EQ(inZone("UTC0").zoneAbbreviation(), "UTC");
}

TEST_F(LinuxClockTest, SteadyTimeOnlyMovesForward) {
  const LinuxClock clock;
  const SteadyTime first = clock.steadyNow();
  EXPECT_LE(first, clock.steadyNow());
}

TEST_F(LinuxClockTest, WallTimeIsTheSystemsOwn) {
  const LinuxClock clock;
  const auto before = std::chrono::system_clock::now();
  const WallTime now = clock.wallNow();
  EXPECT_GE(now, std::chrono::floor<std::chrono::microseconds>(before));
  EXPECT_LE(now, std::chrono::system_clock::now());
}

}  // namespace
}  // namespace zal
