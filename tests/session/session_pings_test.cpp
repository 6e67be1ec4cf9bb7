#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

class SessionPingsTest : public SessionFixture {
 protected:
  SessionPingsTest() { fakes.configuration.endpoints.reportServer = "reports.example"; }
  void start(bool useWifi) {
    session->startPing(useWifi);
    fakes.queues.runAll();
  }
  std::string tmp = fakes.configuration.roots.TemporaryRoot;
};

TEST_F(SessionPingsTest, WithoutWifiQueuesOnePing) {
  start(false);
  ASSERT_EQ(fakes.pings.tests.size(), 1U);
  const auto& test = *fakes.pings.tests[0];
  EXPECT_EQ(test.address, "reports.example");
  EXPECT_EQ(test.seconds, 8.0);
  EXPECT_FALSE(test.wifi);
}

TEST_F(SessionPingsTest, WithWifiQueuesGatewayAndReportServer) {
  start(true);
  ASSERT_EQ(fakes.pings.tests.size(), 2U);
  EXPECT_EQ(fakes.pings.tests[0]->address, kDefaultGatewayAddress);
  EXPECT_EQ(fakes.pings.tests[1]->address, "reports.example");
  for (const auto& test : fakes.pings.tests) {
    EXPECT_TRUE(test->wifi);
    EXPECT_EQ(test->seconds, 8.0);
  }
}

TEST_F(SessionPingsTest, BringsTheResultsIntoThePingDirectory) {
  start(true);
  start(false);
  for (const auto& test : fakes.pings.tests) test->finish("answered", true);
  fakes.queues.runAll();
  for (const auto& test : fakes.pings.tests) {
    for (const auto& path : test->written) writeFile(path, test->address);
  }
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  session->endSessionWithSender("caller");
  EXPECT_EQ(listTree(receiverDirectory), R"(Log (14-03-07).log
Ping/
Ping/ping-en0-reports.example-2024_05_02_14_03_07.log
Ping/ping-gateway-2024_05_02_14_03_07.log
Ping/ping-pdp_ip0-reports.example.-2024_05_02_14_03_07.log
Quality Log (14-03-07).log
Verbose Log (14-03-07).log
)");
}

TEST_F(SessionPingsTest, NeitherBeginsTheSessionNorKeepsItActive) {
  start(true);
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 0U);
}

}  // namespace
}  // namespace zal::testing
