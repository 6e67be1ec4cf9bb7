#include <chrono>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

class VistelSessionTest : public SessionFixture {
 protected:
  int notifications = 0;
  void* notifiedObject = nullptr;

  VistelSessionTest() {
    fakes.localNotifications.observe("LirraLogSessionBecameInactiveNotification", [this](void* object) {
      ++notifications;
      notifiedObject = object;
    });
  }
};

TEST_F(VistelSessionTest, IsIdleWhenMade) {
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(session->sessionType(), "Vistel");
  EXPECT_EQ(session->endFlags(), 0U);
  EXPECT_FALSE(session->isInitiator());
  EXPECT_FALSE(session->logCheckpointsToConsole());
  EXPECT_FALSE(session->logDescriptionsToConsole());
  EXPECT_EQ(session->failureReason(), std::nullopt);
  EXPECT_EQ(host.pendingTimers(), 0U);
}

TEST_F(VistelSessionTest, BeginMakesItActiveWithPulseAndInactivityRequest) {
  session->beginSessionWithSender("caller");
  EXPECT_TRUE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 2U);
}

TEST_F(VistelSessionTest, EndLeavesNoTimer) {
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("caller");
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 0U);
}

TEST_F(VistelSessionTest, BeginOnAnActiveSessionEndsItWithForceAndTheNewSender) {
  session->beginSessionWithSender("a");
  noteCheckpoints(2);
  session->beginSessionWithSender("b");
  EXPECT_TRUE(session->isActive());
  EXPECT_EQ(simpleLog(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Sender: FORCE: b] End Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] 2   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] 1   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: a] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
)");
  session->noteCheckpoint("x", kNow + 1, "b");
  session->noteCheckpoint("y", kNow + 2, "b");
  host.advance(3s);
  session->endSessionWithSender("b");
  EXPECT_EQ(simpleLog(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Sender: b] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: b] x   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: b] y   [14:03:09.251  (2024-05-02) (CEST)]
[Sender: b] End Session  [14:03:10.251  (2024-05-02) (CEST)]
)");
}

TEST_F(VistelSessionTest, EndOfANeverBegunSessionWritesNothingAndLeavesNoRequest) {
  session->endSessionWithSender("caller");
  EXPECT_FALSE(std::filesystem::exists(base));
  EXPECT_EQ(host.pendingTimers(), 0U);
  EXPECT_EQ(collections, std::vector<CollectionRequest>{});
}

TEST_F(VistelSessionTest, EndWithoutBeginAfterAPulseCancelsTheRequest) {
  session->pulseFromSender("caller");
  EXPECT_EQ(host.pendingTimers(), 1U);
  session->endSessionWithSender("caller");
  EXPECT_EQ(host.pendingTimers(), 0U);
}

TEST_F(VistelSessionTest, ReportsItselfInactiveAfter240SecondsAndOnlyOnce) {
  session->beginSessionWithSender("caller");
  host.advance(239'999ms);
  EXPECT_EQ(notifications, 0);
  host.advance(1ms);
  EXPECT_EQ(notifications, 1);
  EXPECT_EQ(notifiedObject, session.get());
  host.advance(1ms);
  host.advance(480s);
  EXPECT_EQ(notifications, 1);
}

TEST_F(VistelSessionTest, AnyEntryRestartsThe240Seconds) {
  const std::vector<std::function<void()>> signs{
      [&] { session->beginSessionWithSender("c"); },
      [&] { session->noteCheckpoint("x", kNow, "c"); },
      [&] { session->logDescription("x", "y", "c", kNow); },
      [&] { session->logCallInfo("x", "y", "c"); },
      [&] { session->logQualityMetric("x", Number(1.0), "c"); },
      [&] { session->logQualityCategory("x", "y", "c"); },
      [&] { session->pulseFromSender("c"); },
  };
  for (const auto& sign : signs) {
    sign();
    host.advance(239'999ms);
    EXPECT_EQ(notifications, 0);
  }
  host.advance(1ms);
  EXPECT_EQ(notifications, 1);
}

TEST_F(VistelSessionTest, FilesPingsAndSignalSamplesDoNotRestartThe240Seconds) {
  session->beginSessionWithSender("caller");
  host.advance(239'999ms);
  session->addLogFile("/some/file", "caller", "Video");
  session->startPing(true);
  host.advance(1ms);
  EXPECT_EQ(notifications, 1);
}

TEST_F(VistelSessionTest, SurvivesAnObserverThatDropsIt) {
  std::weak_ptr<ZalLoggingAgentVistelSession> watched = session;
  fakes.localNotifications.observe("LirraLogSessionBecameInactiveNotification", [this](void*) {
    session->endSessionWithSender("INACTIVE");
    session.reset();
  });
  session->beginSessionWithSender("caller");
  host.advance(240s);
  EXPECT_EQ(notifications, 1);
  EXPECT_TRUE(watched.expired());
  EXPECT_EQ(host.pendingTimers(), 0U);
}

TEST_F(VistelSessionTest, TakesItsTimersAlongWhenItGoes) {
  session->beginSessionWithSender("caller");
  session.reset();
  EXPECT_EQ(host.pendingTimers(), 0U);
  host.advance(480s);
  EXPECT_EQ(notifications, 0);
}

TEST_F(VistelSessionTest, OnlyTheSenderEndAllMakesTheCollectionRunAtOnce) {
  for (const char* sender : {"ENDALL", "caller", "INACTIVE", "endall", "ENDALL "}) {
    session->beginSessionWithSender("caller");
    noteCheckpoints(2);
    session->endSessionWithSender(sender);
  }
  std::vector<bool> background;
  for (const auto& request : collections) background.push_back(request.background);
  EXPECT_EQ(background, (std::vector<bool>{false, true, true, true, true}));
}

TEST_F(VistelSessionTest, TheBeginLineStandsInTwoLogsAndTheEndLineInAllThree) {
  session->beginSessionWithSender("caller");
  host.advance(100ms);
  session->logQualityCategory("1", "", "caller");
  session->logQualityCategory("2", "", "caller");
  session->logQualityCategory("3", "", "caller");
  host.advance(100ms);
  session->endSessionWithSender("caller");
  EXPECT_EQ(simpleLog(), R"([Time: Separator]
[Reference Time: Unknown reference time!]
[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:07.451  (2024-05-02) (CEST)]
)");
  EXPECT_EQ(verboseLog(), simpleLog());
  EXPECT_EQ(qualityLog(), R"([Reference Time: Unknown reference time!]
[Time: Separator]
[Sender: caller] 1   [14:03:07.351  (2024-05-02) (CEST)]
[Sender: caller] 2   [14:03:07.351  (2024-05-02) (CEST)]
[Sender: caller] 3   [14:03:07.351  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:07.451  (2024-05-02) (CEST)]
)");
}

TEST_F(VistelSessionTest, BeginKeepsAnEmptySenderAsItIs) {
  session->setLogCheckpointsToConsole(true);
  session->beginSessionWithSender("");
  EXPECT_EQ(fakes.agentLog.lines,
            Lines{"notice: === [Sender: ] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]"});
}

TEST_F(VistelSessionTest, EchoesBeginAndEndWithCheckpointsAlone) {
  session->setLogDescriptionsToConsole(true);
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("caller");
  EXPECT_EQ(fakes.agentLog.lines, Lines{});
  session = makeSession();
  session->setLogCheckpointsToConsole(true);
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("caller");
  EXPECT_EQ(fakes.agentLog.lines,
            (Lines{"notice: === [Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]",
                   "notice: === [Sender: caller] End Session  [14:03:07.251  (2024-05-02) (CEST)]"}));
}

TEST_F(VistelSessionTest, AnEntryAfterTheEndBeginsAfresh) {
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("ENDALL");
  session->noteCheckpoint("again", kNow, "caller");
  EXPECT_TRUE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 2U);
}

TEST_F(VistelSessionTest, TimersFollowSteadyTimeWhenTheWallClockJumps) {
  session->beginSessionWithSender("caller");
  host.setWall(host.wallNow() + 24h);
  host.advance(239'999ms);
  EXPECT_EQ(notifications, 0);
  host.advance(1ms);
  EXPECT_EQ(notifications, 1);
}

TEST_F(VistelSessionTest, PoorNetworkConditionsChangeNothing) {
  session->noteBadNetworkConditions();
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 0U);
}

TEST_F(VistelSessionTest, PropertiesReadBackWhatWasSet) {
  session->setFailureReason("reason");
  session->setInitiator("alice");
  session->setRecipient("bob");
  session->setIsInitiator(true);
  session->setEndFlags(0xFFFFFFFF);
  EXPECT_EQ(session->failureReason(), "reason");
  EXPECT_EQ(session->initiator(), "alice");
  EXPECT_EQ(session->recipient(), "bob");
  EXPECT_TRUE(session->isInitiator());
  EXPECT_EQ(session->endFlags(), 0xFFFFFFFF);
  session->setFailureReason(std::nullopt);
  EXPECT_EQ(session->failureReason(), std::nullopt);
}

}  // namespace
}  // namespace zal::testing
