#include "tests/collectors/network_fixture.h"

namespace zal {
namespace {

class SessionCapturesTest : public testing::NetworkFixture {
 protected:
  SessionCapturesTest() { fake.deviceSupport.videoCallsOverCellular = true; }
};

constexpr const char* kStop = "run /usr/bin/killall -9 tessel\n";

TEST_F(SessionCapturesTest, FlagsOfNothingStartNothingButStopReadersAndRunningPings) {
  pings.addPingTest("192.0.2.1", 0, true, std::nullopt);
  network.StartSessionCaptures(0);
  EXPECT_EQ(happened(), std::string("ping 192.0.2.1 over wifi\n") + kStop);
  EXPECT_TRUE(fake.pings.tests.at(0)->stopped);
}

TEST_F(SessionCapturesTest, NobodyWaitsForTheReadersAndEachStartStopsWhatWasStartedBefore) {
  network.StartSessionCaptures(2);
  network.StartSessionCaptures(0);
  bool isNext = false;
  network.stopCapturesThen([&] { isNext = true; });
  EXPECT_EQ(events, std::vector<std::string>{});
  EXPECT_EQ(happened(),
            std::string(kStop) +
                "run /usr/bin/tessel -w > \"~/tmp/vistel-syslog.log\"  2>&1 &\n"
                "run /usr/bin/tessel -k Time ge -5m > \"~/tmp/vistel-syslog-before.log\"  2>&1 &\n" +
                kStop + kStop);
  EXPECT_TRUE(isNext);
}

TEST_F(SessionCapturesTest, FlagOneAlonePingsTheServerOverCellularAndThenTheGateway) {
  network.StartSessionCaptures(1);
  EXPECT_EQ(happened(),
            std::string(kStop) + "ping 192.0.2.11 over cellular\nping <default gateway> over wifi\n");
  EXPECT_EQ(finishedPings(),
            "ping 192.0.2.11 over cellular for 60 into ~/tmp/vistel-pdp-ping.log\n"
            "ping <default gateway> over wifi for 60 into ~/tmp/vistel-ping.log\n");
}

TEST_F(SessionCapturesTest, WithoutVideoCallsOverCellularOnlyTheGatewayIsPinged) {
  fake.deviceSupport.videoCallsOverCellular = false;
  network.StartSessionCaptures(1);
  EXPECT_EQ(finishedPings(), "ping <default gateway> over wifi for 60 into ~/tmp/vistel-ping.log\n");
}

TEST_F(SessionCapturesTest, FlagTwoAloneStartsTheLiveCaptureAndThenItsLookBackAndNoPing) {
  network.StartSessionCaptures(2);
  EXPECT_EQ(happened(), R"(run /usr/bin/killall -9 tessel
run /usr/bin/tessel -w > "~/tmp/vistel-syslog.log"  2>&1 &
run /usr/bin/tessel -k Time ge -5m > "~/tmp/vistel-syslog-before.log"  2>&1 &
)");
}

TEST_F(SessionCapturesTest, BothFlagsStartPingsAndThenReaders) {
  network.StartSessionCaptures(3);
  EXPECT_EQ(happened(), R"(run /usr/bin/killall -9 tessel
ping 192.0.2.11 over cellular
ping <default gateway> over wifi
run /usr/bin/tessel -w > "~/tmp/vistel-syslog.log"  2>&1 &
run /usr/bin/tessel -k Time ge -5m > "~/tmp/vistel-syslog-before.log"  2>&1 &
)");
}

TEST_F(SessionCapturesTest, PreferencePingtestStartsThePingsWithoutTheFlag) {
  prefer("pingtest", true);
  network.StartSessionCaptures(0);
  EXPECT_EQ(happened(),
            std::string(kStop) + "ping 192.0.2.11 over cellular\nping <default gateway> over wifi\n");
}

TEST_F(SessionCapturesTest, PreferencePingtestSetToFalseCountsAsAbsent) {
  prefer("pingtest", false);
  network.StartSessionCaptures(0);
  EXPECT_EQ(happened(), kStop);
}

TEST_F(SessionCapturesTest, OtherFlagsStartNothing) {
  network.StartSessionCaptures(~std::uint64_t{3});
  EXPECT_EQ(happened(), kStop);
}

TEST_F(SessionCapturesTest, SecondStartStopsThePingsOfTheFirst) {
  network.StartSessionCaptures(1);
  happened();
  network.StartSessionCaptures(1);
  happened();
  ASSERT_EQ(fake.pings.tests.size(), 4U);
  for (const std::size_t first : {0U, 1U}) EXPECT_TRUE(fake.pings.tests[first]->stopped);
  for (const std::size_t second : {2U, 3U}) EXPECT_FALSE(fake.pings.tests[second]->stopped);
}

TEST_F(SessionCapturesTest, ServerThatIsNotConfiguredIsPingedAllTheSameAndTheResultsSaySo) {
  fake.configuration.endpoints.cellPingServer.clear();
  network.StartSessionCaptures(1);
  EXPECT_EQ(finishedPings(),
            "ping  over cellular for 60 into ~/tmp/vistel-pdp-ping.log\n"
            "ping <default gateway> over wifi for 60 into ~/tmp/vistel-ping.log\n");
}

TEST_F(SessionCapturesTest, StopIsWaitedForAndLeavesShortPingsAlone) {
  pings.addPingTest("192.0.2.1", 15.0, true, std::nullopt);
  pings.addPingTest("192.0.2.2", 16.0, true, std::nullopt);
  network.StopCaptures();
  EXPECT_EQ(happened(), std::string("ping 192.0.2.1 over wifi\nping 192.0.2.2 over wifi\n") + kStop);
  EXPECT_FALSE(fake.pings.tests.at(0)->stopped);
  EXPECT_TRUE(fake.pings.tests.at(1)->stopped);
}

TEST_F(SessionCapturesTest, ServerPingsStopTheCapturesAndGoToBothServers) {
  network.StartServerPings("/w/wifi.log", "/c/cellular.log");
  EXPECT_EQ(happened(), std::string(kStop) + "ping 192.0.2.11 over cellular\nping 192.0.2.12 over wifi\n");
  EXPECT_EQ(finishedPings(),
            "ping 192.0.2.11 over cellular for 60 into /c/cellular.log\n"
            "ping 192.0.2.12 over wifi for 60 into /w/wifi.log\n");
}

TEST_F(SessionCapturesTest, ServerPingsWithoutVideoCallsOverCellularLeaveTheCellularServerOut) {
  fake.deviceSupport.videoCallsOverCellular = false;
  network.StartServerPings("/w/wifi.log", "/c/cellular.log");
  EXPECT_EQ(finishedPings(), "ping 192.0.2.12 over wifi for 60 into /w/wifi.log\n");
}

TEST_F(SessionCapturesTest, VideoCallsOverCellularAreWhatTheDeviceSupportSays) {
  EXPECT_TRUE(network.VideoCallsOverCellularAvailable());
  fake.deviceSupport.videoCallsOverCellular = false;
  EXPECT_FALSE(network.VideoCallsOverCellularAvailable());
}

}  // namespace
}  // namespace zal
