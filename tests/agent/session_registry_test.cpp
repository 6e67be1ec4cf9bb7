#include <gmock/gmock.h>

#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

class SessionRegistryTest : public testing::AgentFixture {
 protected:
  void begin(OptionalText type, OptionalText sender = "caller", std::int64_t beginFlags = 0,
             std::int64_t endFlags = 0) {
    server->beginSession(type, sender, beginFlags, endFlags);
  }
  [[nodiscard]] bool isActive(const std::string& key) const {
    return session(key) && session(key)->isActive();
  }
  /// So that a session has enough lines to be written.
  void addLines(const std::string& type) {
    for (const char* text : {"one", "two", "three"})
      server->noteCheckpoint(text, type, 1714651388.0, "caller");
  }
  [[nodiscard]] std::string reportTree() const {
    const std::string& root = fake.configuration.roots.DiagnosticReportRoot;
    return std::filesystem::exists(root) ? testing::listTree(root) : "";
  }
};

TEST_F(SessionRegistryTest, ABeginRegistersAnActiveSessionUnderItsType) {
  createLogging();
  begin("Vistel");
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
  EXPECT_TRUE(isActive("Vistel"));
  EXPECT_EQ(session("Vistel")->sessionType(), "Vistel");
}

TEST_F(SessionRegistryTest, ASecondBeginEndsTheFirstSessionAtOnceWithTheSecondSenderAndOneRemains) {
  createLogging();
  begin("Vistel", "first", 0, 11);
  const auto first = session("Vistel");
  addLines("Vistel");
  begin("Vistel", "second", 0, 22);
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
  EXPECT_NE(session("Vistel"), first);
  EXPECT_FALSE(first->isActive());
  EXPECT_TRUE(isActive("Vistel"));
  EXPECT_THAT(report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Log (14-03-07).log"),
              HasSubstr("[Sender: second] End Session  [14:03:07.251  (2024-05-02) (CEST)]\n"));
}

TEST_F(SessionRegistryTest, TheEndOfTheProcessWaitsForTheFilesOfALargeSession) {
  createLogging();
  begin("Vistel");
  for (int line = 0; line < 5; ++line) {
    server->logDescription(std::string(1U << 20U, 'x'), "", "Vistel", "caller", 1714651388.0);
  }
  server->endAllSessions();
  EXPECT_THAT(calls, ElementsAre("StartSessionCaptures 0"));
  server->stop();
  ASSERT_EQ(calls.size(), 2U);
  EXPECT_THAT(calls[1], HasSubstr("CollectServiceLogs Vistel"));
  EXPECT_THAT(report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Verbose Log (14-03-07).log"),
              HasSubstr("[Sender: ENDALL] End Session  [14:03:07.251  (2024-05-02) (CEST)]\n"));
}

TEST_F(SessionRegistryTest, CapturesAreStartedBeforeTheEarlierSessionIsWritten) {
  createLogging();
  begin("Vistel", "first", 3, 11);
  addLines("Vistel");
  begin("Vistel", "second", 5, 22);
  writeSessions();
  const std::string root = std::filesystem::canonical(fake.configuration.roots.DiagnosticReportRoot);
  EXPECT_THAT(calls, ElementsAre("StartSessionCaptures 3", "StartSessionCaptures 5",
                                 "CollectServiceLogs Vistel into " + root +
                                     "/Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver), reason none, "
                                     "background, flags 11"));
}

TEST_F(SessionRegistryTest, BeginFlags4MarkTheInitiatorAndFlags3DoNot) {
  createLogging();
  begin("Vistel", "caller", 4);
  begin("Nexa", "caller", 3);
  begin("Messages", "caller", 7);
  begin("Registration", "caller", -1);
  EXPECT_TRUE(session("Vistel")->isInitiator());
  EXPECT_FALSE(session("Nexa")->isInitiator());
  EXPECT_TRUE(session("Messages")->isInitiator());
  EXPECT_TRUE(session("Registration")->isInitiator());
}

TEST_F(SessionRegistryTest, AllBeginFlagsReachTheCapturesAndTheEndFlagsTheSession) {
  createLogging();
  begin("Vistel", "caller", 0x1'0000'0003, 0x7F);
  EXPECT_THAT(calls, ElementsAre("StartSessionCaptures 4294967299"));
  EXPECT_EQ(session("Vistel")->endFlags(), 0x7FU);
}

TEST_F(SessionRegistryTest, ACheckpointWithin3SecondsOfTheEndReachesTheOldSession) {
  createLogging();
  begin("Vistel");
  const auto old = session("Vistel");
  addLines("Vistel");
  server->endSession("Vistel", "ender");
  advance(2'999ms);
  server->noteCheckpoint("late", "Vistel", 1714651390.0, "caller");
  EXPECT_TRUE(old->isActive());
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
  EXPECT_FALSE(server->isInactivityTimerPending());
  advance(1ms);
  EXPECT_FALSE(old->isActive());
  EXPECT_THAT(registeredKeys(), IsEmpty());
  EXPECT_TRUE(server->isInactivityTimerPending());
  const std::string log = report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Log (14-03-07).log");
  EXPECT_THAT(log, HasSubstr("[Sender: caller] late   [14:03:10.000  (2024-05-02) (CEST)]\n"
                             "[Sender: ender] End Session  [14:03:10.251  (2024-05-02) (CEST)]\n"));
}

TEST_F(SessionRegistryTest, WithBothCallLoggingSwitchesOffNothingHappensAndTheIdleTimerRunsOn) {
  create();
  advance(100s);
  begin("Vistel");
  server->noteCheckpoint("text", "Vistel", 1.0, "caller");
  server->pulseForSession("Vistel", "caller");
  EXPECT_THAT(registeredKeys(), IsEmpty());
  EXPECT_THAT(calls, IsEmpty());
  EXPECT_TRUE(server->isInactivityTimerPending());
  // Only the end's own note counts as activity.
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow() - 100s);
  server->endSession("Vistel", "caller", true);
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow() - 100s);
  server->endSession("Vistel", "caller");
  EXPECT_EQ(fake.host.pendingTimers(), 1U);
  EXPECT_EQ(reportTree(), "");
}

TEST_F(SessionRegistryTest, AnEndRequestIsActivityEvenWhileCallLoggingIsOff) {
  create();
  advance(100s);
  server->endSession("Vistel", "caller");
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
}

TEST_F(SessionRegistryTest, BeginsAndEndsReadThePreferencesAndEntriesDoNot) {
  create();
  const int before = fake.preferences.synchronizations;
  begin("Vistel");
  EXPECT_EQ(fake.preferences.synchronizations, before + 1);
  switchOn("CallLogging");
  server->noteCheckpoint("text", "Vistel", 1.0, "caller");
  server->pulseForSession("Vistel", "caller");
  EXPECT_EQ(fake.preferences.synchronizations, before + 1);
  EXPECT_FALSE(server->switches().isCallLoggingEnabled());
  begin("Vistel");
  EXPECT_EQ(fake.preferences.synchronizations, before + 2);
  EXPECT_TRUE(isActive("Vistel"));
  server->endSession("Vistel", "caller");
  EXPECT_EQ(fake.preferences.synchronizations, before + 3);
}

TEST_F(SessionRegistryTest, AnEmptyAnAbsentAndAPathTypeEndingInCurrentShareOneSession) {
  createLogging();
  begin("", "a");
  const auto first = session("Current");
  begin(std::nullopt, "b");
  const auto second = session("Current");
  begin("some/path/Current", "c");
  const auto third = session("Current");
  EXPECT_THAT(registeredKeys(), ElementsAre("Current"));
  EXPECT_NE(first, second);
  EXPECT_NE(second, third);
  EXPECT_FALSE(second->isActive());
  EXPECT_TRUE(third->isActive());
}

TEST_F(SessionRegistryTest, AnEndWithAPathTypeEndsTheSessionAfter3SecondsAndLeavesItRegistered) {
  createLogging();
  begin("Vistel");
  server->endSession("some/path/Vistel", "caller");
  advance(2'999ms);
  EXPECT_TRUE(isActive("Vistel"));
  advance(1ms);
  EXPECT_FALSE(isActive("Vistel"));
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
  EXPECT_FALSE(server->isInactivityTimerPending());
}

TEST_F(SessionRegistryTest, AnEndWithATrailingSlashLeavesTheSessionRegisteredToo) {
  createLogging();
  begin("Vistel/");
  server->endSession("Vistel/", "caller");
  advance(3s);
  EXPECT_FALSE(isActive("Vistel"));
  EXPECT_THAT(registeredKeys(), ElementsAre("Vistel"));
}

TEST_F(SessionRegistryTest, AnEndWithAnEmptyTypeRemovesCurrent) {
  createLogging();
  begin("");
  server->endSession(std::nullopt, "caller");
  advance(3s);
  EXPECT_THAT(registeredKeys(), IsEmpty());
}

TEST_F(SessionRegistryTest, EndAllSessionsEndsEveryOneAndLeavesEveryKeyRegistered) {
  createLogging();
  begin("Vistel");
  begin("Nexa");
  server->endAllSessions();
  EXPECT_THAT(registeredKeys(), ElementsAre("Nexa", "Vistel"));
  EXPECT_FALSE(isActive("Vistel"));
  EXPECT_FALSE(isActive("Nexa"));
  EXPECT_FALSE(server->isInactivityTimerPending());
}

TEST_F(SessionRegistryTest, EndAllSessionsCollectsAtOnceInTheForeground) {
  createLogging();
  begin("Vistel", "caller", 4, 9);
  addLines("Vistel");
  server->noteFailureReason("no answer", "Vistel", "caller");
  server->endAllSessions();
  const std::string root = std::filesystem::canonical(fake.configuration.roots.DiagnosticReportRoot);
  EXPECT_THAT(calls, ElementsAre("StartSessionCaptures 4",
                                 "CollectServiceLogs Vistel into " + root +
                                     "/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator), reason Vistel - no "
                                     "answer, at once, flags 9"));
}

TEST_F(SessionRegistryTest, ABeginAfterEndAllSessionsReplacesTheEndedSession) {
  createLogging();
  begin("Vistel");
  const auto ended = session("Vistel");
  server->endAllSessions();
  begin("Vistel");
  EXPECT_NE(session("Vistel"), ended);
  EXPECT_TRUE(isActive("Vistel"));
}

TEST_F(SessionRegistryTest, ABeginWithin3SecondsOfTheEndStartsANewSessionThatTheDelayedEndThenEnds) {
  createLogging();
  begin("Vistel");
  const auto old = session("Vistel");
  server->endSession("Vistel", "caller");
  advance(2s);
  begin("Vistel");
  const auto fresh = session("Vistel");
  EXPECT_NE(fresh, old);
  EXPECT_FALSE(old->isActive());
  advance(999ms);
  EXPECT_TRUE(fresh->isActive());
  advance(1ms);
  EXPECT_FALSE(fresh->isActive());
  EXPECT_THAT(registeredKeys(), IsEmpty());
}

TEST_F(SessionRegistryTest, ADelayedEndDoesNothingOnceCallLoggingWasSwitchedOff) {
  createLogging();
  begin("Vistel");
  server->endSession("Vistel", "caller");
  switchOff("CallLogging");
  server->readLoggingPreferences();
  advance(3s);
  EXPECT_TRUE(isActive("Vistel"));
}

TEST_F(SessionRegistryTest, ASessionThatBecameInactiveIsEndedAndRemoved) {
  createLogging();
  begin("Vistel");
  addLines("Vistel");
  advance(239'999ms);
  EXPECT_TRUE(isActive("Vistel"));
  advance(1ms);
  EXPECT_THAT(registeredKeys(), IsEmpty());
  EXPECT_TRUE(server->isInactivityTimerPending());
  EXPECT_THAT(report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Log (14-03-07).log"),
              HasSubstr("[Sender: INACTIVE] End Session  [14:07:07.251  (2024-05-02) (CEST)]\n"));
}

TEST_F(SessionRegistryTest, AnInactiveSessionIsEndedWhateverTheSwitchesSay) {
  createLogging();
  begin("Vistel");
  switchOff("CallLogging");
  server->readLoggingPreferences();
  advance(240s);
  EXPECT_THAT(registeredKeys(), IsEmpty());
}

TEST_F(SessionRegistryTest, AnInactivityNoticeWithoutASessionOnlyNotesActivity) {
  createLogging();
  advance(5s);
  fake.localNotifications.post(kSessionBecameInactive, nullptr);
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
}

TEST_F(SessionRegistryTest, APulseKeepsASessionOpenAndDoesNotNoteActivity) {
  createLogging();
  begin("Vistel");
  advance(239s);
  server->pulseForSession("a/Vistel", "caller");
  advance(239'999ms);
  EXPECT_TRUE(isActive("Vistel"));
  advance(1ms);
  EXPECT_THAT(registeredKeys(), IsEmpty());
}

TEST_F(SessionRegistryTest, EntriesForAnUnknownTypeDoNotCreateASession) {
  createLogging();
  server->noteCheckpoint("text", "Vistel", 1.0, "caller");
  server->logDescription("text", "log", "Vistel", "caller", 1.0);
  server->logCallInfo("info", "category", "Vistel", "caller");
  server->addCallMetric("rtt", Number{1.5}, "Vistel", "caller");
  server->addLogFile("/tmp/x", "Vistel", "caller", "category");
  server->logCallQuality("text", "log", "Vistel", "caller");
  server->noteFailureReason("reason", "Vistel", "caller");
  server->noteInitiator("a", "Vistel", "caller");
  server->noteReceiver("b", "Vistel", "caller");
  server->pulseForSession("Vistel", "caller");
  server->endSession("Vistel", "caller", true);
  EXPECT_THAT(registeredKeys(), IsEmpty());
  EXPECT_EQ(reportTree(), "");
}

TEST_F(SessionRegistryTest, ConsoleOutputVerboseAloneTurnsOnBothEchoesOfLaterSessionsOnly) {
  createLogging();
  begin("Vistel");
  switchOn("ConsoleOutputVerbose");
  begin("Nexa");
  EXPECT_FALSE(session("Vistel")->logCheckpointsToConsole());
  EXPECT_FALSE(session("Vistel")->logDescriptionsToConsole());
  EXPECT_TRUE(session("Nexa")->logCheckpointsToConsole());
  EXPECT_TRUE(session("Nexa")->logDescriptionsToConsole());
}

TEST_F(SessionRegistryTest, ConsoleOutputAloneTurnsOnTheCheckpointEcho) {
  switchOn("ConsoleOutput");
  createLogging();
  begin("Vistel");
  EXPECT_TRUE(session("Vistel")->logCheckpointsToConsole());
  EXPECT_FALSE(session("Vistel")->logDescriptionsToConsole());
}

TEST_F(SessionRegistryTest, HostileTypesStayBelowTheReportRoot) {
  createLogging();
  const std::string types[] = {
      "../../outside",       "..", "/", "$(touch X)", std::string("a\0b", 3), "line\nbreak",
      std::string(4096, 'x')};
  for (const std::string& type : types) {
    begin(type);
    addLines(type);
  }
  server->endAllSessions();
  std::string expected;
  EXPECT_THAT(registeredKeys(),
              ElementsAre("$(touch X)", "Current", "a_b", "line_break", "outside", std::string(255, 'x')));
  for (const std::string& key : registeredKeys()) {
    expected += key + "/\n";
    const std::string directory = key + "/2024-05-02 at 14-03-07 (CEST) (Receiver)/";
    expected += directory + "\n" + directory + "Log (14-03-07).log\n" + directory +
                "Quality Log (14-03-07).log\n" + directory + "Verbose Log (14-03-07).log\n";
  }
  EXPECT_EQ(reportTree(), expected);
  for (const auto& entry : std::filesystem::directory_iterator(fake.home.path())) {
    EXPECT_THAT(entry.path().filename().string(), ::testing::AnyOf("Logs", "tmp"));
  }
}

TEST_F(SessionRegistryTest, AForcedNetworkDumpGoesIntoAFreshDirectoryAndNotesThePoorNetwork) {
  createLogging();
  server->forceNetworkDump();
  const std::string directory =
      std::filesystem::canonical(fake.configuration.roots.DiagnosticReportRoot).string() +
      "/Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)";
  EXPECT_TRUE(std::filesystem::is_directory(directory));
  EXPECT_THAT(calls, ElementsAre("ForceNetworkDump " + directory + " with ping"));
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("console:: ** Noting poor network conditions for all sessions **"));
}

TEST_F(SessionRegistryTest, AServerThatGoesAwayEndsItsSessionsAndItsDelayedEndsFindNobody) {
  createLogging();
  begin("Vistel", "caller", 0, 0);
  addLines("Vistel");
  server->endSession("Vistel", "caller");
  server.reset();
  EXPECT_THAT(report("Vistel/2024-05-02 at 14-03-07 (CEST) (Receiver)/Log (14-03-07).log"),
              HasSubstr("[Sender: ENDALL] End Session"));
  advance(1000s);
  EXPECT_THAT(fake.processExit.exits, IsEmpty());
}

TEST_F(SessionRegistryTest, ADelayedEndComesThreeSecondsLaterWhateverTheWallClockDoes) {
  createLogging();
  for (const auto jump : {-5h, 5h}) {
    begin("Vistel");
    server->endSession("Vistel", "caller");
    fake.host.setWall(fake.host.wallNow() + jump);
    advance(2999ms);
    EXPECT_TRUE(isActive("Vistel"));
    advance(1ms);
    EXPECT_THAT(registeredKeys(), IsEmpty());
  }
}

TEST_F(SessionRegistryTest, ADelayedEndOverWhichTheHostSleptComesWhenItWakes) {
  createLogging();
  begin("Vistel");
  server->endSession("Vistel", "caller");
  fake.host.sleep(2999ms);
  EXPECT_TRUE(isActive("Vistel"));
  fake.host.sleep(1h);
  EXPECT_THAT(registeredKeys(), IsEmpty());
}

}  // namespace
}  // namespace zal
