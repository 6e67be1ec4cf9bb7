#include "session/ping_requests.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

constexpr LocalTime kBegin{2024, 5, 2, 14, 3, 7, 251};

Endpoints reportServer(const std::string& host) {
  Endpoints endpoints;
  endpoints.reportServer = host;
  return endpoints;
}

TEST(PingRequestsTest, PingsGatewayAndReportServerOverWifi) {
  EXPECT_EQ(sessionPings(true, reportServer("reports.example"), kBegin),
            (std::vector<SessionPing>{
                {std::nullopt, "ping-gateway-2024_05_02_14_03_07.log", true},
                {"reports.example", "ping-en0-reports.example-2024_05_02_14_03_07.log", true}}));
}

TEST(PingRequestsTest, PingsTheReportServerAloneOtherwise) {
  EXPECT_EQ(sessionPings(false, reportServer("reports.example"), kBegin),
            (std::vector<SessionPing>{
                {"reports.example", "ping-pdp_ip0-reports.example.-2024_05_02_14_03_07.log", false}}));
}

TEST(PingRequestsTest, AServerThatIsNotConfiguredIsNotTheGateway) {
  EXPECT_EQ(sessionPings(false, reportServer(""), kBegin),
            (std::vector<SessionPing>{{"", "ping-pdp_ip0-reportHost.-2024_05_02_14_03_07.log", false}}));
}

TEST(PingRequestsTest, AHostNeverLeadsToAnotherDirectory) {
  EXPECT_EQ(sessionPings(false, reportServer("../x"), kBegin).front().fileName,
            "ping-pdp_ip0-.._x.-2024_05_02_14_03_07.log");
}

}  // namespace
}  // namespace zal
