#include <cstdlib>

#include "tests/client/client_fixture.h"

namespace zal::testing {
namespace {

class LirraRequestsTest : public ClientFixture {
 protected:
  LirraRequestsTest() { startAgent(); }
  /// What the agent gets for the one request that `call` makes.
  template <class Call>
  std::string sent(Call&& call) {
    lirra::Client client = open();
    EXPECT_EQ(call(client), LIRRA_OK);
    EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
    const auto requests = agent->requests();
    return requests.empty() ? "nothing" : requests.back();
  }
};

TEST_F(LirraRequestsTest, BeginNamesTheSessionTypeAndBothFlags) {
  EXPECT_EQ(
      sent([](auto& c) { return c.beginSession("Vistel", LIRRA_BEGIN_INITIATOR, 64); }),
      R"({"__ipc__event_code__": 0, "beginSessionFlags": 4, "endSessionFlags": 64, "sender": "tester", )"
      R"("sessionType": "Vistel"})");
}

TEST_F(LirraRequestsTest, EndNamesTheSessionType) {
  EXPECT_EQ(sent([](auto& c) { return c.endSession("Vistel"); }),
            R"({"__ipc__event_code__": 1, "sender": "tester", "sessionType": "Vistel"})");
}

TEST_F(LirraRequestsTest, CheckpointHasItsTime) {
  EXPECT_EQ(
      sent([](auto& c) { return c.checkpoint("Vistel", "Connected", 1714658587.25); }),
      R"({"__ipc__event_code__": 2, "checkpoint": "Connected", "sender": "tester", "session": "Vistel", )"
      R"("time": 1714658587.25})");
}

TEST_F(LirraRequestsTest, DescriptionNamesTheSessionTypeAndKeepsItsLines) {
  EXPECT_EQ(sent([](auto& c) { return c.describe("Vistel", "codec", "a\nb", 42.5); }),
            R"({"__ipc__event_code__": 3, "description": "codec", "logString": "a\nb", "sender": "tester", )"
            R"("sessionType": "Vistel", "time": 42.5})");
}

TEST_F(LirraRequestsTest, CallInfoHasCategoryAndInfo) {
  EXPECT_EQ(sent([](auto& c) { return c.callInfo("Vistel", "Codec", "opus"); }),
            R"({"__ipc__event_code__": 4, "callInfo": "opus", "category": "Codec", "sender": "tester", )"
            R"("session": "Vistel"})");
}

TEST_F(LirraRequestsTest, CallQualityHasDescriptionAndLog) {
  EXPECT_EQ(sent([](auto& c) { return c.callQuality("Vistel", "audio", "good"); }),
            R"({"__ipc__event_code__": 5, "description": "audio", "logString": "good", "sender": "tester", )"
            R"("session": "Vistel"})");
}

TEST_F(LirraRequestsTest, MetricTravelsAsACodedValueOfItsOwnKind) {
  const std::string begin = R"({"__ipc__event_code__": 6, "description": "rtt", "number": )";
  const std::string end = R"(, "sender": "tester", "session": "Vistel"})";
  EXPECT_EQ(sent([](auto& c) { return c.callMetric("Vistel", "rtt", 4.5); }), begin + "<4.5>" + end);
  EXPECT_EQ(sent([](auto& c) { return c.callMetric("Vistel", "rtt", std::int64_t{-3}); }),
            begin + "<-3>" + end);
  EXPECT_EQ(sent([](auto& c) { return c.callMetric("Vistel", "rtt", std::uint64_t{7}); }),
            begin + "<7u>" + end);
  EXPECT_EQ(sent([](auto& c) { return c.callMetric("Vistel", "rtt", 41); }), begin + "<41>" + end);
}

TEST_F(LirraRequestsTest, PulseHasTheSessionAlone) {
  EXPECT_EQ(sent([](auto& c) { return c.pulse("Vistel"); }),
            R"({"__ipc__event_code__": 7, "sender": "tester", "session": "Vistel"})");
}

TEST_F(LirraRequestsTest, ActionWithoutInfoIsTheShortRequest) {
  EXPECT_EQ(sent([](auto& c) { return c.action("Vistel", 3); }),
            R"({"__ipc__event_code__": 8, "action": 3, "sender": "tester", "session": "Vistel"})");
}

TEST_F(LirraRequestsTest, ActionWithInfoCarriesItsTypes) {
  lirra::Dictionary info;
  info.set("target", "+15550100").setInt64("interval", -1).setUInt64("flags", 3).setBool("useWifi", true);
  info.setDouble("limit", 0.5);
  EXPECT_EQ(
      sent([&](auto& c) { return c.action("Vistel", 15, info); }),
      R"({"__ipc__event_code__": 9, "action": 15, "sender": "tester", "session": "Vistel", "userInfo": )"
      R"({"flags": 3u, "interval": -1, "limit": 0.5, "target": "+15550100", "useWifi": true}})");
}

TEST_F(LirraRequestsTest, SessionEventHasItsNumber) {
  EXPECT_EQ(sent([](auto& c) { return c.sessionEvent("Vistel", -9); }),
            R"({"__ipc__event_code__": 10, "event": -9, "sender": "tester", "session": "Vistel"})");
}

TEST_F(LirraRequestsTest, IdentitiesAndFailureReasonHaveKeysOfTheirOwn) {
  EXPECT_EQ(sent([](auto& c) { return c.initiator("Vistel", "alice"); }),
            R"({"__ipc__event_code__": 11, "initiator": "alice", "sender": "tester", "session": "Vistel"})");
  EXPECT_EQ(sent([](auto& c) { return c.receiver("Vistel", "bob"); }),
            R"({"__ipc__event_code__": 12, "receiver": "bob", "sender": "tester", "session": "Vistel"})");
  EXPECT_EQ(
      sent([](auto& c) { return c.failureReason("Vistel", "no route"); }),
      R"({"__ipc__event_code__": 13, "failureReason": "no route", "sender": "tester", "session": "Vistel"})");
}

TEST_F(LirraRequestsTest, LogFileHasCategoryAndPath) {
  EXPECT_EQ(sent([](auto& c) { return c.addLogFile("Vistel", "Media", "/tmp/a.pcap"); }),
            R"({"__ipc__event_code__": 14, "category": "Media", "path": "/tmp/a.pcap", "sender": "tester", )"
            R"("session": "Vistel"})");
}

TEST_F(LirraRequestsTest, RecordsHaveAnUnsignedTime) {
  EXPECT_EQ(
      sent([](auto& c) { return c.log("Messages", "Net", "up", 3, 99); }),
      R"({"__ipc__event_code__": 15, "category": "Net", "level": 3, "logString": "up", "sender": "tester", )"
      R"("time": 99u, "type": "Messages"})");
  EXPECT_EQ(
      sent([](auto& c) { return c.event("Messages", "Net", "up", 3, 99); }),
      R"({"__ipc__event_code__": 16, "category": "Net", "eventString": "up", "level": 3, "sender": "tester", )"
      R"("time": 99u, "type": "Messages"})");
}

TEST_F(LirraRequestsTest, NullLeavesTheKeyOut) {
  EXPECT_EQ(sent([](auto& c) { return c.log(nullptr, nullptr, nullptr); }),
            R"({"__ipc__event_code__": 15, "level": 0, "sender": "tester", "time": 0u})");
  EXPECT_EQ(sent([](auto& c) { return c.pulse(nullptr); }),
            R"({"__ipc__event_code__": 7, "sender": "tester"})");
}

TEST_F(LirraRequestsTest, NoSenderLeavesTheSenderOut) {
  lirra::Client::Options options;
  options.socketPath = socketPath();
  lirra::Client client(options);
  EXPECT_EQ(client.pulse("Vistel"), LIRRA_OK);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  EXPECT_EQ(agent->requests(),
            std::vector<std::string>{R"({"__ipc__event_code__": 7, "session": "Vistel"})"});
}

TEST_F(LirraRequestsTest, NowIsFilledInAsSecondsSince1970) {
  const std::string request = sent([](auto& c) { return c.checkpoint("Vistel", "x"); });
  const auto at = request.find("\"time\": ");
  ASSERT_NE(at, std::string::npos) << request;
  EXPECT_NEAR(std::strtod(request.c_str() + at + 8, nullptr), static_cast<double>(::time(nullptr)), 5.0);
}

TEST_F(LirraRequestsTest, HugeTextArrivesWhole) {
  lirra::Client client = open(20U << 20U);
  const std::string text(3'000'000, 'x');
  EXPECT_EQ(client.log("Messages", "Net", text), LIRRA_OK);
  EXPECT_EQ(client.flush(kPatienceMs), LIRRA_OK);
  ASSERT_EQ(agent->requests().size(), 1U);
  EXPECT_NE(agent->requests()[0].find("3000000"), std::string::npos) << agent->requests()[0].substr(0, 2000);
}

TEST_F(LirraRequestsTest, TextLargerThanTheAgentTakesIsRefusedAndCounted) {
  lirra::Client client = open(64U << 20U);
  EXPECT_EQ(client.log("Messages", "Net", std::string(17'000'000, 'x')), LIRRA_TOO_LARGE);
  EXPECT_EQ(client.statistics().dropped, 1U);
}

TEST_F(LirraRequestsTest, WithoutAHandleEverythingIsInvalid) {
  EXPECT_EQ(lirra_pulse(nullptr, "Vistel"), LIRRA_INVALID);
  EXPECT_EQ(lirra_flush(nullptr, 0), LIRRA_INVALID);
  EXPECT_EQ(lirra_close(nullptr, 0), LIRRA_INVALID);
  EXPECT_EQ(lirra_status(nullptr, nullptr), LIRRA_INVALID);
  EXPECT_EQ(lirra_trouble(nullptr, nullptr, 0), 0U);
  EXPECT_EQ(lirra_action_ask(nullptr, nullptr, 0, nullptr, nullptr), LIRRA_INVALID);
}

}  // namespace
}  // namespace zal::testing
