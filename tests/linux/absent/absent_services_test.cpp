#include <gtest/gtest.h>

#include "platform/linux/absent/absent_crash_reporter.h"
#include "platform/linux/absent/absent_network_status.h"
#include "platform/linux/absent/absent_telephony.h"
#include "tests/support/fake_services.h"

namespace zal::testing {
namespace {

TEST(AbsentTelephonyTest, NobodyCanConnect) {
  AbsentTelephony telephony;
  EXPECT_EQ(telephony.connect(), nullptr);
  EXPECT_EQ(telephony.connect(), nullptr);
}

TEST(AbsentNetworkStatusTest, IsNotAssociatedAndHasNoValues) {
  AbsentNetworkStatus status;
  EXPECT_FALSE(status.isWifiAssociated());
  EXPECT_FALSE(status.scaledRssi());
  EXPECT_FALSE(status.signalStrength());
  EXPECT_FALSE(status.scaledRate());
}

TEST(AbsentCrashReporterTest, RefusesEverythingAndSaysSoOnceForEachKind) {
  RecordingAgentLog log;
  AbsentCrashReporter reporter(log);
  for (int round = 0; round < 3; ++round) {
    EXPECT_FALSE(reporter.simulateCrash(1, 0xFED9E2FFU, "message"));
    EXPECT_FALSE(reporter.simulateCrashForException("description"));
    EXPECT_FALSE(reporter.stackshot("reason", 1));
  }
  EXPECT_EQ(log.lines, (std::vector<std::string>{
                           "notice: This host has no crash service: crash reports of processes are not made",
                           "notice: This host has no crash service: crash reports of exceptions are not made",
                           "notice: This host has no crash service: stackshots are not made"}));
}

}  // namespace
}  // namespace zal::testing
