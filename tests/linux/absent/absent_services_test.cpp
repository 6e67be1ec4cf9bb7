#include <gtest/gtest.h>

#include "platform/linux/absent/absent_device_support.h"
#include "platform/linux/absent/absent_network_status.h"
#include "platform/linux/absent/absent_radio_coexistence.h"
#include "platform/linux/absent/absent_telephony.h"

namespace zal::testing {
namespace {

TEST(AbsentTelephonyTest, NobodyCanConnect) {
  AbsentTelephony telephony;
  EXPECT_EQ(telephony.connect(), nullptr);
  EXPECT_EQ(telephony.connect(), nullptr);
  int answers = 0;
  telephony.sampleSignal([&answers](const std::optional<CellularSignal>& signal) {
    ++answers;
    EXPECT_FALSE(signal);
  });
  EXPECT_EQ(answers, 1);
}

TEST(AbsentNetworkStatusTest, IsNotAssociatedAndHasNoValues) {
  AbsentNetworkStatus status;
  int answers = 0;
  status.sampleWifi([&answers](const std::optional<WifiSignal>& signal) {
    ++answers;
    ASSERT_TRUE(signal);
    EXPECT_FALSE(signal->isAssociated);
    EXPECT_FALSE(signal->scaledRssi || signal->signalStrength || signal->scaledRate);
  });
  EXPECT_EQ(answers, 1);
}

TEST(AbsentDeviceSupportTest, HasNoNameAndNoCallsOverCellular) {
  AbsentDeviceSupport support;
  EXPECT_EQ(support.deviceName(), "");
  EXPECT_FALSE(support.videoCallsOverCellularAvailable());
}

TEST(AbsentRadioCoexistenceTest, HasNothingToCall) {
  AbsentRadioCoexistence coexistence;
  EXPECT_FALSE(coexistence.logDumpEntryPoint());
}

}  // namespace
}  // namespace zal::testing
