#include "platform/linux/bus/telephony/modem_names.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

TEST(ModemNamesTest, ModesAreJoinedFromTheLowestBit) {
  EXPECT_EQ(modeNames(2 | 4 | 8), "2g|3g|4g");
  EXPECT_EQ(modeNames(31), "cs|2g|3g|4g|5g");
  EXPECT_EQ(modeNames(16), "5g");
  EXPECT_EQ(modeNames(0), "none");
  EXPECT_EQ(modeNames(0xFFFFFFFF), "any");
}

TEST(ModemNamesTest, TechnologiesHaveModemManagersWords) {
  EXPECT_EQ(accessTechnologyNames(2), "gsm");
  EXPECT_EQ(accessTechnologyNames(32), "umts");
  EXPECT_EQ(accessTechnologyNames(16384), "lte");
  EXPECT_EQ(accessTechnologyNames(32768), "5gnr");
  EXPECT_EQ(accessTechnologyNames(16384 | 32768), "lte|5gnr");
  EXPECT_EQ(accessTechnologyNames(1 << 17), "lte-nb-iot");
  EXPECT_EQ(accessTechnologyNames(0), "unknown");
}

TEST(ModemNamesTest, RegistrationsHaveModemManagersWords) {
  EXPECT_EQ(registrationName(0), "idle");
  EXPECT_EQ(registrationName(1), "home");
  EXPECT_EQ(registrationName(3), "denied");
  EXPECT_EQ(registrationName(5), "roaming");
  EXPECT_EQ(registrationName(11), "attached-rlos");
}

TEST(ModemNamesTest, LocksHaveModemManagersWords) {
  EXPECT_EQ(lockName(0), "unknown");
  EXPECT_EQ(lockName(1), "none");
  EXPECT_EQ(lockName(2), "sim-pin");
  EXPECT_EQ(lockName(4), "sim-puk");
  EXPECT_EQ(lockName(16), "ph-netsub-puk");
}

TEST(ModemNamesTest, ANumberOfALaterModemManagerIsItsOwnText) {
  EXPECT_EQ(registrationName(12), "12");
  EXPECT_EQ(lockName(17), "17");
  EXPECT_EQ(modeNames(32 | 2), "34");
  EXPECT_EQ(accessTechnologyNames(std::uint64_t{1} << 40), "1099511627776");
}

}  // namespace
}  // namespace zal::testing
