#include "agent/agent_entry.h"

#include <gmock/gmock.h>

#include <stdexcept>

#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

/// The process entry around the shared server.
class AgentEntryTest : public testing::AgentFixture {
 protected:
  void SetUp() override { ZalLoggingAgentServer::resetSharedInstanceForTests(); }
  void TearDown() override { ZalLoggingAgentServer::resetSharedInstanceForTests(); }
  int run() { return runAgent(fake.platform, sessions.services(), recordingHooks()); }
  static ZalLoggingAgentServer& shared() { return *ZalLoggingAgentServer::sharedInstance(); }
};

TEST_F(AgentEntryTest, WithoutAPlatformThereIsNoSharedServer) {
  EXPECT_EQ(ZalLoggingAgentServer::sharedInstance(), nullptr);
}

TEST_F(AgentEntryTest, AServerThatCannotBeMadeIsSaidAndEndsWithStatus0) {
  class FailingPreferences : public testing::FakePreferences {
    void synchronize(std::string_view) override { throw std::runtime_error("no store"); }
  } failing;
  Platform broken = fake.with(failing);
  EXPECT_EQ(runAgent(broken), 0);
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("warning: The server could not be set up: no store",
                                               "warning: Could not create ZalLoggingAgentServer server"));
  EXPECT_THAT(fake.ipc.listenerNames, IsEmpty());
}

TEST_F(AgentEntryTest, ListensUnderTheServiceNameAndReturns0WhenTheLoopEnds) {
  EXPECT_EQ(run(), 0);
  EXPECT_THAT(fake.ipc.listenerNames, ElementsAre("com.vendel.lirra"));
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_TRUE(shared().isRunning());
  EXPECT_GE(fake.logFacility.flushes, 1);
}

TEST_F(AgentEntryTest, TheSharedServerIsMadeOnce) {
  ZalLoggingAgentServer::lendPlatform(fake.platform, sessions.services());
  auto* const first = ZalLoggingAgentServer::sharedInstance();
  EXPECT_EQ(ZalLoggingAgentServer::sharedInstance(), first);
  EXPECT_THAT(fake.systemNotifications.observers, SizeIs(1));
}

TEST_F(AgentEntryTest, StartingTwiceMakesOneListenerAndNotesActivityBothTimes) {
  run();
  advance(1s);
  shared().start();
  EXPECT_THAT(fake.ipc.listenerNames, SizeIs(1));
  EXPECT_EQ(shared().lastActivity(), fake.host.steadyNow());
  advance(1s);
  shared().start();
  EXPECT_EQ(shared().lastActivity(), fake.host.steadyNow());
}

TEST_F(AgentEntryTest, StartUpDeletesVerboseLogsOfTheFourKnownTypesBelowTheUsersLogs) {
  const std::string root = fake.configuration.roots.MobileLogRoot;
  for (const char* type : {"Registration", "Messages", "Vistel", "Current"}) {  // Nexa is missing
    testing::writeFile(root + "/" + type + "/a-Verbose-b.log", "old");
    testing::writeFile(root + "/" + type + "/a.log", "kept");
  }
  run();
  EXPECT_EQ(testing::listTree(root),
            "Current/\nCurrent/a-Verbose-b.log\nCurrent/a.log\n"
            "Messages/\nMessages/a.log\nRegistration/\nRegistration/a.log\nVistel/\nVistel/a.log\n");
}

TEST_F(AgentEntryTest, AUserLogRootWrittenWithATildeIsExpandedForThePurge) {
  fake.configuration.roots.MobileLogRoot = "~/Logs";
  testing::writeFile(fake.home / "Logs/Vistel/a-Verbose-b.log", "old");
  run();
  EXPECT_EQ(testing::listTree(fake.home / "Logs"), "Vistel/\n");
}

TEST_F(AgentEntryTest, AnInvalidListenerEndsTheProcessAndAbandonsOpenSessions) {
  switchOn("CallLogging");
  run();
  shared().beginSession("Vistel", "caller", 0, 0);
  fake.ipc.onInvalid();
  EXPECT_THAT(fake.processExit.exits, ElementsAre(0));
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("warning: Connection went invalid, exiting"));
  EXPECT_TRUE(shared().sessions().at("Vistel")->isActive());
}

TEST_F(AgentEntryTest, AnExceptionThatEscapesTheLoopIsReportedAsACrashAndEndsInGoodOrder) {
  fake.host.post([] { throw std::runtime_error("broken task"); });
  EXPECT_EQ(run(), 0);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("warning: ZalLoggingAgentServer exception caught on main thread: broken task"));
  EXPECT_EQ(fake.agentLog.backtraces, 1);
  EXPECT_THAT(fake.crashReporter.exceptions, ElementsAre("broken task"));
  EXPECT_THAT(fake.processExit.exits, IsEmpty());
}

TEST_F(AgentEntryTest, WhatIsNoExceptionObjectPassesThrough) {
  fake.host.post([] { throw 42; });
  EXPECT_THROW(run(), int);
  EXPECT_EQ(fake.agentLog.backtraces, 0);
  EXPECT_THAT(fake.crashReporter.exceptions, IsEmpty());
}

TEST_F(AgentEntryTest, APreferenceNotificationSwitchesCallLoggingOn) {
  run();
  EXPECT_FALSE(shared().switches().isCallLoggingEnabled());
  switchOn("VerboseCallLogging");
  fake.systemNotifications.post("kLirraSyncLoggingPrefs");
  EXPECT_TRUE(shared().switches().isCallLoggingEnabled());
}

TEST_F(AgentEntryTest, AReloadReadsThePreferencesAsTheNotificationDoes) {
  run();
  switchOn("CallLogging");
  fake.hostSignals.reload();
  EXPECT_TRUE(shared().switches().isCallLoggingEnabled());
}

TEST_F(AgentEntryTest, AnOpenSessionKeepsItsEchoesWhenThePreferencesChange) {
  switchOn("CallLogging");
  run();
  shared().beginSession("Vistel", "caller", 0, 0);
  switchOn("ConsoleOutputVerbose");
  fake.systemNotifications.post("kLirraSyncLoggingPrefs");
  EXPECT_FALSE(shared().sessions().at("Vistel")->logCheckpointsToConsole());
}

TEST_F(AgentEntryTest, ATerminationEndsAllSessionsFlushesAndExits) {
  switchOn("CallLogging");
  run();
  shared().beginSession("Vistel", "caller", 0, 0);
  const int flushes = fake.logFacility.flushes;
  fake.hostSignals.terminate();
  EXPECT_FALSE(shared().sessions().at("Vistel")->isActive());
  EXPECT_EQ(fake.logFacility.flushes, flushes + 1);
  EXPECT_THAT(fake.processExit.exits, ElementsAre(0));
}

}  // namespace
}  // namespace zal
