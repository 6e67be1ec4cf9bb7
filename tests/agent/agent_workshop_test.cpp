#include "agent/agent_workshop.h"

#include <gmock/gmock.h>

#include "agent/agent_entry.h"
#include "agent/zal_logging_agent_server.h"
#include "dump/log_compressor.h"
#include "tests/support/fake_platform.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::Contains;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

/// The agent as its process runs it, with the real diagnostics behind the server.
class AgentWorkshopTest : public ::testing::Test {
 protected:
  AgentWorkshopTest() {
    ZalLoggingAgentServer::resetSharedInstanceForTests();
    fake.preferences.stored["CallLogging"] = true;
    runAgent(fake.platform);
  }
  ~AgentWorkshopTest() override { ZalLoggingAgentServer::resetSharedInstanceForTests(); }

  static ZalLoggingAgentServer& server() { return *ZalLoggingAgentServer::sharedInstance(); }
  void finish() {
    for (int round = 0; round < 4; ++round) {
      fake.queues.runAll();
      fake.host.advance(5s);
    }
    fake.queues.runAll();
  }
  void act(std::int64_t action, const ValueMap& info) {
    server().performAction(action, "Vistel", "caller", peer, &message, &info);
  }

  testing::FakePlatform fake;
  std::shared_ptr<testing::FakePeer> fakePeer = std::make_shared<testing::FakePeer>();
  std::shared_ptr<PeerConnection> peer = fakePeer;
  testing::FakeMessage message;
};

TEST_F(AgentWorkshopTest, ADumpThatAClientAsksForIsMadeAndAnswered) {
  message.token = 77;
  act(14, {{"displayFlags", std::int64_t{4}}});
  finish();
  ASSERT_THAT(fakePeer->replies, SizeIs(1));
  EXPECT_EQ(fakePeer->replies[0].first, 77U);
}

TEST_F(AgentWorkshopTest, ASessionThatEndsIsCollectedInTheBackground) {
  server().beginSession("Vistel", "caller", 0, 0x2000);
  for (const char* text : {"a", "b", "c"}) server().noteCheckpoint(text, "Vistel", 1714651387.0, "caller");
  server().endSession("Vistel", "caller", true);
  while (fake.queues.runNext("session.logs")) fake.host.drain();
  ASSERT_THAT(fake.dumpProgress.plans, SizeIs(1));
  EXPECT_EQ(fake.dumpProgress.plans[0].service, "Vistel");
  EXPECT_THAT(fake.dumpProgress.plans[0].steps, Contains("Video-call logs"));
  EXPECT_THAT(fake.fileCopier.started, IsEmpty());
  finish();
  EXPECT_THAT(fake.fileCopier.started, SizeIs(1));
}

TEST_F(AgentWorkshopTest, ASessionThatBeginsStartsTheCapturesItAskedFor) {
  server().beginSession("Vistel", "caller", 2, 0);
  fake.queues.runAll();
  EXPECT_THAT(fake.shell.commands, Contains(::testing::HasSubstr("tessel")));
}

TEST_F(AgentWorkshopTest, AForcedNetworkDumpIsTaken) {
  server().forceNetworkDump();
  finish();
  EXPECT_THAT(fake.agentLog.lines, Contains("notice: **** Generating network logs ****"));
}

TEST_F(AgentWorkshopTest, PingsOfAnActionRunInTheOpenSession) {
  act(15, {{"useWifi", true}});
  EXPECT_THAT(fake.pings.tests, IsEmpty());
  server().beginSession("Vistel", "caller", 0, 0);
  act(15, {{"useWifi", true}});
  fake.queues.runAll();
  EXPECT_THAT(fake.pings.tests, Not(IsEmpty()));
}

TEST_F(AgentWorkshopTest, ARunningAutomationOutlivesTheIdleLimitAndAStoppedOneDoesNot) {
  act(8, {});
  fake.host.advance(361s);
  fake.host.advance(361s);
  EXPECT_THAT(fake.processExit.exits, IsEmpty());
  act(9, {});
  fake.host.advance(361s);
  fake.host.advance(361s);
  EXPECT_THAT(fake.processExit.exits, Not(IsEmpty()));
}

TEST_F(AgentWorkshopTest, EverythingIsThereAsLongAsTheServerIs) {
  EXPECT_NE(_LirraLogCompressor::sharedInstance(), nullptr);
  EXPECT_NE(_ZalLoggingAgentPingRunner::sharedInstance(), nullptr);
  ZalLoggingAgentServer::resetSharedInstanceForTests();
  EXPECT_EQ(_LirraLogCompressor::sharedInstance(), nullptr);
  EXPECT_EQ(_ZalLoggingAgentPingRunner::sharedInstance(), nullptr);
}

}  // namespace
}  // namespace zal
