#include <regex>

#include "client/lirra.hpp"
#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using ::testing::EndsWith;
using testing::eventually;
using testing::withoutTimes;

/// A call from its begin to its files, through the client library and the real socket.
class WholeSessionE2eTest : public testing::E2eFixture {
 protected:
  /// What depends on the machine: its model, and what its shell says of the missing time tool.
  static std::string normalized(const std::string& text) {
    const std::string timeless = withoutTimes(text);
    const std::string withoutDevice =
        std::regex_replace(timeless, std::regex(R"((^|\n)\[Device: [^\n]*\](?=\n))"), "");
    return std::regex_replace(withoutDevice, std::regex(R"(\[Reference Time: [^\n]*\])"),
                              "[Reference Time: TEXT]");
  }
};

TEST_F(WholeSessionE2eTest, ACallReportedThroughTheLibraryBecomesThreeLogFiles) {
  start();
  const std::string trace = sandbox / "tmp/trace.txt";
  testing::writeFile(trace, "a trace");
  lirra::Client client({.socketPath = sandbox.socketPath(), .sender = "callservice"});
  ASSERT_TRUE(client);
  client.beginSession("Vistel", LIRRA_BEGIN_INITIATOR, 0);
  client.initiator("Vistel", "ann@example.org");
  client.receiver("Vistel", "bob@example.org");
  client.failureReason("Vistel", "network lost");
  client.callInfo("Vistel", "Codec", "opus");
  client.checkpoint("Vistel", "Invite", 1714651381.5);
  client.checkpoint("Vistel", "Connected", 1714651383.5);
  client.describe("Vistel", "Offer", "v=0\nm=audio", 1714651382.5);
  client.callQuality("Vistel", "Video", "fair");
  client.callMetric("Vistel", "rtt", 20.5);
  client.callMetric("Vistel", "rtt", 21.5);
  client.addLogFile("Vistel", "Traces", trace);
  client.endSession("Vistel");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  // The collected file is moved when the logs are written.
  ASSERT_TRUE(eventually([&] { return !std::filesystem::exists(trace); }));
  // Its end is a barrier later: the move is one step of a request that runs to its end first.
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);

  EXPECT_THAT(sandbox.sessionDirectory("Vistel"), EndsWith(" (CEST) (Initiator)"));
  EXPECT_EQ(normalized(sandbox.sessionFile("Vistel", "Log")),
            "[Time: Separator]\n"
            "[Reference Time: TEXT]\n"
            "[Codec: opus]\n"
            "[Build Version: 21A5]\n"
            "[Product Version: 7.1]\n"
            "[Product Name: Test OS]\n"
            "[Failure Reason: network lost]\n"
            "[Recipient ID: bob@example.org]\n"
            "[Initiator ID: ann@example.org]\n"
            "[Sender: callservice] Invite   [TIME]\n"
            "[Sender: callservice] Connected   [TIME]\n"
            "[Sender: callservice] Begin Session  [TIME]\n"
            "[Sender: callservice] End Session  [TIME]\n");
  EXPECT_EQ(normalized(sandbox.sessionFile("Vistel", "Verbose Log")),
            "[Time: Separator]\n"
            "[Reference Time: TEXT]\n"
            "[Codec: opus]\n"
            "[Build Version: 21A5]\n"
            "[Product Version: 7.1]\n"
            "[Product Name: Test OS]\n"
            "[Failure Reason: network lost]\n"
            "[Recipient ID: bob@example.org]\n"
            "[Initiator ID: ann@example.org]\n"
            "[Sender: callservice] Invite   [TIME]\n"
            "[Sender: callservice] Offer: v=0\nm=audio   [TIME]\n"
            "[Sender: callservice] Connected   [TIME]\n"
            "[Sender: callservice] Begin Session  [TIME]\n"
            "[Sender: callservice] End Session  [TIME]\n");
  EXPECT_EQ(normalized(sandbox.sessionFile("Vistel", "Quality Log")),
            "[Initiator ID: ann@example.org]\n"
            "[Recipient ID: bob@example.org]\n"
            "[Failure Reason: network lost]\n"
            "[Product Name: Test OS]\n"
            "[Product Version: 7.1]\n"
            "[Build Version: 21A5]\n"
            "[Codec: opus]\n"
            "[Reference Time: TEXT]\n"
            "[Time: Separator]\n"
            "[Sender: callservice] Video: fair   [TIME]\n"
            "[Sender: callservice] rtt: 20.5   [TIME]\n"
            "[Sender: callservice] rtt: 21.5   [TIME]\n"
            "[Sender: callservice] End Session  [TIME]\n"
            "========================================\n"
            "  [rtt]\n"
            " Average: 21\n"
            "     Min: 20.5\n"
            "     Max: 21.5\n"
            "  Median: 21\n"
            "  StdDev: 0.5\n");
  EXPECT_EQ(testing::readFile(sandbox.sessionDirectory("Vistel") + "/Traces/trace.txt"), "a trace");
}

TEST_F(WholeSessionE2eTest, ABarrierAfterARequestThatEndsASessionAtOnceFindsItsFiles) {
  start();
  lirra::Client client({.socketPath = sandbox.socketPath(), .sender = "callservice"});
  for (const char* round : {"first", "second"}) {
    client.beginSession("Vistel");
    client.checkpoint("Vistel", round, 1714651381.5);
    client.describe("Vistel", round, "", 1714651382.5);
  }
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Verbose Log"), ::testing::HasSubstr("] End Session"));
}

}  // namespace
}  // namespace zal
