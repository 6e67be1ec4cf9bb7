#include "collectors/name_timestamp.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>

#include "tests/support/manual_run_loop.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

class NameTimestampTest : public ::testing::Test {
 protected:
  std::optional<WallTime> dashed(std::string_view text) const {
    return parseTimestamp(text, kDashedTimestamp, clock);
  }
  ManualRunLoop clock;  // two hours ahead of UTC
};

TEST_F(NameTimestampTest, BothFormsNameTheLocalTime) {
  const WallTime moment{1714651387s};
  EXPECT_EQ(dashed("2024-05-02-14-03-07"), moment);
  EXPECT_EQ(parseTimestamp("2024-05-02-140307", kCompactTimestamp, clock), moment);
  EXPECT_EQ(timestampText(moment + 999ms, kDashedTimestamp, clock), "2024-05-02-14-03-07");
  EXPECT_EQ(timestampText(moment, kCompactTimestamp, clock), "2024-05-02-140307");
}

TEST_F(NameTimestampTest, FollowsTheZoneOfTheClock) {
  clock.zoneOffset = -5h;
  EXPECT_EQ(dashed("2024-05-02-07-03-07"), WallTime{1714651387s});
}

TEST_F(NameTimestampTest, TextOfAnotherFormIsNoTimestamp) {
  for (const char* text :
       {"", "2024-05-02-14-03-0", "2024-05-02-14-03-077", "2024-05-02 14-03-07", "2024-05-02-14-03-0x",
        "-024-05-02-14-03-07", "+024-05-02-14-03-07", " 024-05-02-14-03-07", "2024-05-02-14-03-\xd9\xa7"}) {
    EXPECT_EQ(dashed(text), std::nullopt) << text;
  }
}

TEST_F(NameTimestampTest, ImpossibleDatesAndTimesAreNoTimestamps) {
  for (const char* text :
       {"2023-02-29-14-03-07", "2024-13-02-14-03-07", "2024-00-02-14-03-07", "2024-04-31-14-03-07",
        "2024-05-02-24-00-00", "2024-05-02-14-60-07", "2024-05-02-14-03-61", "2024-05-00-14-03-07"}) {
    EXPECT_EQ(dashed(text), std::nullopt) << text;
  }
  EXPECT_TRUE(dashed("2024-02-29-14-03-07"));
}

TEST_F(NameTimestampTest, IsTakenFromItsPositionInTheName) {
  EXPECT_EQ(timestampAt("dump-a-2024-05-02-14-03-07.log", 7, kDashedTimestamp, clock), WallTime{1714651387s});
  EXPECT_EQ(timestampAt("SystemLog-2024-05-02-140307", 10, kCompactTimestamp, clock), WallTime{1714651387s});
  EXPECT_EQ(timestampAt("SystemLog-once-upon-a-time-there", 10, kCompactTimestamp, clock), std::nullopt);
}

TEST_F(NameTimestampTest, ANameWithoutRoomForItIsOutOfRange) {
  EXPECT_THROW((void)timestampAt("SystemLog", 10, kCompactTimestamp, clock), std::out_of_range);
  EXPECT_THROW((void)timestampAt("SystemLog-2024-05-02-14030", 10, kCompactTimestamp, clock),
               std::out_of_range);
}

TEST_F(NameTimestampTest, TheLimitOfADumpIsOneSecondBeforeItsStart) {
  EXPECT_EQ(dumpLimit(WallTime{1714651387251ms}), WallTime{1714651386251ms});
}

}  // namespace
}  // namespace zal::testing
