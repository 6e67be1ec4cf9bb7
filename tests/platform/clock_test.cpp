#include "platform/clock.h"

#include <gtest/gtest.h>

#include <limits>

namespace zal {
namespace {

TEST(ClockTest, SecondsComeBackAsTheyWent) {
  EXPECT_DOUBLE_EQ(secondsSinceEpoch(wallTimeFromSeconds(1714651387.25)), 1714651387.25);
  EXPECT_DOUBLE_EQ(secondsSinceEpoch(wallTimeFromSeconds(-1.5)), -1.5);
}

TEST(ClockTest, TimesThatNoCalendarShowsAreClamped) {
  const double infinity = std::numeric_limits<double>::infinity();
  EXPECT_EQ(secondsSinceEpoch(wallTimeFromSeconds(infinity)), 253402300799.0);
  EXPECT_EQ(secondsSinceEpoch(wallTimeFromSeconds(1e300)), 253402300799.0);
  EXPECT_EQ(secondsSinceEpoch(wallTimeFromSeconds(-infinity)), -62135596800.0);
  EXPECT_EQ(wallTimeFromSeconds(std::numeric_limits<double>::quiet_NaN()), WallTime{});
}

}  // namespace
}  // namespace zal
