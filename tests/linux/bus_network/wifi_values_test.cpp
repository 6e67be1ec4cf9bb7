#include "platform/linux/bus/network/wifi_values.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using Unsigned = std::uint64_t;
using Signed = std::int64_t;

TEST(WifiValuesTest, TheRssiFollowsFromTheStrengthOnTheManagersScale) {
  EXPECT_EQ(rssiOfStrength(100), -40);
  EXPECT_EQ(rssiOfStrength(99), -40);
  EXPECT_EQ(rssiOfStrength(98), -41);
  EXPECT_EQ(rssiOfStrength(73), -56);
  EXPECT_EQ(rssiOfStrength(50), -70);
  EXPECT_EQ(rssiOfStrength(1), -99);
  EXPECT_EQ(rssiOfStrength(0), -100);
  EXPECT_EQ(rssiOfStrength(255), -40);
}

TEST(WifiValuesTest, TheStrengthFollowsFromTheRssiOnTheSameScale) {
  EXPECT_EQ(strengthOfRssi(-20), 100U);
  EXPECT_EQ(strengthOfRssi(-40), 100U);
  EXPECT_EQ(strengthOfRssi(-41), 99U);
  EXPECT_EQ(strengthOfRssi(-70), 50U);
  EXPECT_EQ(strengthOfRssi(-100), 0U);
  EXPECT_EQ(strengthOfRssi(-120), 0U);
}

TEST(WifiValuesTest, EachNumberKeepsItsKind) {
  const WifiSignal signal = associatedSignal({.strength = 73, .bitRate = 866700, .polledRssi = -51});
  EXPECT_TRUE(signal.isAssociated);
  EXPECT_EQ(signal.scaledRssi, Number(Signed{-51}));
  EXPECT_EQ(signal.signalStrength, Number(Unsigned{73}));
  EXPECT_EQ(signal.scaledRate, Number(866.7));
  EXPECT_EQ(numberText(*associatedSignal({.bitRate = 54000}).scaledRate), "54");
  EXPECT_EQ(associatedSignal({.strength = 50}).scaledRssi, Number(Signed{-70}));
}

TEST(WifiValuesTest, WhatNobodyKnowsIsLeftOut) {
  const WifiSignal signal = associatedSignal({});
  EXPECT_TRUE(signal.isAssociated);
  EXPECT_EQ(signal.scaledRssi, std::nullopt);
  EXPECT_EQ(signal.signalStrength, std::nullopt);
  EXPECT_EQ(signal.scaledRate, std::nullopt);
  EXPECT_EQ(associatedSignal({.bitRate = 0, .linkSpeed = 0}).scaledRate, std::nullopt);
}

TEST(WifiValuesTest, AnRssiThatCannotBeIsTheLastScansOrFollowsFromTheStrength) {
  for (const std::int32_t rssi : {0, 1, 9999, -9999, -200}) {
    EXPECT_EQ(associatedSignal({.strength = 50, .polledRssi = rssi}).scaledRssi, Number(Signed{-70})) << rssi;
    EXPECT_EQ(associatedSignal({.polledRssi = rssi, .scanRssi = -62}).scaledRssi, Number(Signed{-62}))
        << rssi;
    EXPECT_EQ(associatedSignal({.polledRssi = rssi}).scaledRssi, std::nullopt) << rssi;
  }
  EXPECT_EQ(associatedSignal({.strength = 50, .polledRssi = -1}).scaledRssi, Number(Signed{-1}));
  EXPECT_EQ(associatedSignal({.strength = 50, .polledRssi = -199}).scaledRssi, Number(Signed{-199}));
}

TEST(WifiValuesTest, WithoutAStrengthTheRssiGivesOne) {
  const WifiSignal signal = associatedSignal({.polledRssi = -70, .linkSpeed = 144});
  EXPECT_EQ(signal.signalStrength, Number(Unsigned{50}));
  EXPECT_EQ(signal.scaledRssi, Number(Signed{-70}));
  EXPECT_EQ(signal.scaledRate, Number(Signed{144}));
}

TEST(WifiValuesTest, TheManagersRateGoesBeforeTheLinkSpeed) {
  EXPECT_EQ(associatedSignal({.bitRate = 6000, .linkSpeed = 144}).scaledRate, Number(6.0));
  EXPECT_EQ(associatedSignal({.bitRate = 0, .linkSpeed = 144}).scaledRate, Number(Signed{144}));
}

}  // namespace
}  // namespace zal::testing
