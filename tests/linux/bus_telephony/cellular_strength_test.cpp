#include "platform/linux/bus/telephony/cellular_strength.h"

#include <gtest/gtest.h>

#include <limits>
#include <map>
#include <vector>

namespace zal::testing {
namespace {

std::vector<int> numbersOf(const CellularSignal& signal) {
  return {signal.rssi, signal.percentage, signal.graded};
}

TEST(CellularStrengthTest, APercentageGivesItsPlaceOnTheScaleOfAtModems) {
  EXPECT_EQ(numbersOf(cellularSignal(80)), (std::vector{-63, 80, 3}));
  EXPECT_EQ(numbersOf(cellularSignal(0)), (std::vector{-113, 0, 0}));
  EXPECT_EQ(numbersOf(cellularSignal(100)), (std::vector{-51, 100, 4}));
  EXPECT_EQ(cellularSignal(50).rssi, -81);  // 15.5 steps round up
  EXPECT_EQ(cellularSignal(1).rssi, -113);
  EXPECT_EQ(cellularSignal(2).rssi, -111);
}

TEST(CellularStrengthTest, BarsComeJustAboveTheirThresholds) {
  const std::map<int, int> barsOf{{0, 0},  {5, 0},  {6, 1},  {30, 1}, {31, 2},
                                  {55, 2}, {56, 3}, {80, 3}, {81, 4}, {100, 4}};
  for (const auto& [percentage, bars] : barsOf) EXPECT_EQ(gradedStrength(percentage), bars) << percentage;
}

TEST(CellularStrengthTest, AMeasuredPowerReplacesTheDerivedOneAndIsRounded) {
  EXPECT_EQ(numbersOf(cellularSignal(80, -71.0)), (std::vector{-71, 80, 3}));
  EXPECT_EQ(cellularSignal(80, -71.5).rssi, -72);
  EXPECT_EQ(cellularSignal(80, -200.0).rssi, -200);
  EXPECT_EQ(cellularSignal(80, 0.0).rssi, 0);
}

TEST(CellularStrengthTest, APowerThatNoRadioReceivesIsNotBelieved) {
  for (const double rssi : {-200.5, 0.5, 1e300, std::numeric_limits<double>::infinity(),
                            std::numeric_limits<double>::quiet_NaN()}) {
    EXPECT_EQ(cellularSignal(80, rssi).rssi, -63) << rssi;
  }
}

TEST(CellularStrengthTest, APercentageOutsideOfItsRangeIsTakenAsItsEnd) {
  EXPECT_EQ(numbersOf(cellularSignal(-1)), (std::vector{-113, 0, 0}));
  EXPECT_EQ(numbersOf(cellularSignal(101)), (std::vector{-51, 100, 4}));
}

}  // namespace
}  // namespace zal::testing
