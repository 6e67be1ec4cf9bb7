#include <gmock/gmock.h>

#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// When the process ends by itself. On the manual clock a timer fires at its very instant, so an
/// idle interval of exactly 360 s can be made; a real clock is always a little later.
class InactivityTest : public testing::AgentFixture {
 protected:
  void logRecord() { server->log({.text = "something"}); }
  [[nodiscard]] bool hasExited() const { return !fake.processExit.exits.empty(); }
};

TEST_F(InactivityTest, TheLimitIsSixMinutesUnlessATestSaysOtherwise) { EXPECT_EQ(kInactivityLimit, 360s); }

TEST_F(InactivityTest, AFreshAgentThatReceivesNothingExitsWithStatus0Between360And720Seconds) {
  create();
  server->start();
  // At 360 s the idle interval is 360.0 s, which is not greater than the limit.
  advance(719'999ms);
  EXPECT_FALSE(hasExited());
  advance(1ms);
  EXPECT_THAT(fake.processExit.exits, ElementsAre(0));
}

TEST_F(InactivityTest, DoesNotExitAMillisecondBeforeAtOrAfterTheFirstExpiryOfExactlyTheLimit) {
  create();
  advance(359'999ms);
  EXPECT_FALSE(hasExited());
  advance(1ms);
  EXPECT_FALSE(hasExited());
  EXPECT_TRUE(server->isInactivityTimerPending());
  advance(1ms);
  EXPECT_FALSE(hasExited());
}

TEST_F(InactivityTest, TerminateExitsOnlyWhenTheIdleIntervalIsGreaterThanTheLimit) {
  create();
  advance(359'999ms);
  server->terminate();
  EXPECT_FALSE(hasExited());
  advance(1ms);
  server->terminate();
  EXPECT_FALSE(hasExited());
  advance(1ms);
  server->terminate();
  EXPECT_TRUE(hasExited());
  EXPECT_FALSE(server->isInactivityTimerPending());
  EXPECT_EQ(server->lastActivity(), std::nullopt);
}

TEST_F(InactivityTest, ALogRecord100SecondsBeforeTheTimerMakesItReArmAndTheNextExpiryExits) {
  create();
  advance(260s);
  logRecord();
  advance(100s);
  EXPECT_FALSE(hasExited());
  EXPECT_TRUE(server->isInactivityTimerPending());
  advance(359'999ms);
  EXPECT_FALSE(hasExited());
  advance(1ms);
  EXPECT_TRUE(hasExited());
}

TEST_F(InactivityTest, ActivityNeverPostponesAnArmedTimer) {
  create();
  advance(1ms);
  logRecord();
  EXPECT_EQ(fake.host.pendingTimers(), 1U);
  advance(359'999ms);  // fires 359.999 s after the record and re-arms
  advance(360s);       // fires 719.999 s after it
  EXPECT_TRUE(hasExited());
}

TEST_F(InactivityTest, BeginningASessionCancelsTheTimerAndEndingTheLastOneReArmsIt) {
  createLogging();
  server->beginSession("Vistel", "caller", 0, 0);
  EXPECT_FALSE(server->isInactivityTimerPending());
  EXPECT_EQ(server->lastActivity(), std::nullopt);
  server->endSession("Vistel", "caller");
  EXPECT_FALSE(server->isInactivityTimerPending());
  advance(2'999ms);
  EXPECT_FALSE(server->isInactivityTimerPending());
  advance(1ms);
  EXPECT_TRUE(server->isInactivityTimerPending());
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
}

TEST_F(InactivityTest, NoActivityIsNotedWhileASessionIsOpen) {
  createLogging();
  server->beginSession("Vistel", "caller", 0, 0);
  logRecord();
  EXPECT_EQ(server->lastActivity(), std::nullopt);
  EXPECT_FALSE(server->isInactivityTimerPending());
}

TEST_F(InactivityTest, TheTimerStaysAwayWhileOneOfTwoSessionsIsOpen) {
  createLogging();
  server->beginSession("Vistel", "caller", 0, 0);
  server->beginSession("Nexa", "caller", 0, 0);
  server->endSession("Vistel", "caller");
  advance(3s);
  EXPECT_THAT(registeredKeys(), ElementsAre("Nexa"));
  EXPECT_FALSE(server->isInactivityTimerPending());
}

TEST_F(InactivityTest, ASessionKeepsTheAgentAliveAsLongAsItIsFed) {
  createLogging();
  server->beginSession("Vistel", "caller", 0, 0);
  for (int i = 0; i < 10; ++i) {
    advance(239s);
    server->pulseForSession("Vistel", "caller");
  }
  EXPECT_FALSE(hasExited());
}

TEST_F(InactivityTest, AnExpiryDuringAutomationDoesNotExitAndTheNextActivityArmsANewTimer) {
  create();
  server->setAutomationRunning(true);
  advance(720s);
  EXPECT_FALSE(hasExited());
  EXPECT_FALSE(server->isInactivityTimerPending());
  EXPECT_EQ(server->lastActivity(), std::nullopt);
  EXPECT_EQ(fake.host.pendingTimers(), 0U);
  advance(10'000s);
  logRecord();
  EXPECT_TRUE(server->isInactivityTimerPending());
  server->setAutomationRunning(false);
  advance(720s);
  EXPECT_TRUE(hasExited());
}

TEST_F(InactivityTest, AMissingLastActivityCountsAsNoIdleTime) {
  create();
  server->setAutomationRunning(true);
  advance(720s);
  server->setAutomationRunning(false);
  server->terminate();
  EXPECT_FALSE(hasExited());
  EXPECT_TRUE(server->isInactivityTimerPending());
}

TEST_F(InactivityTest, AWallClockThatJumpsMakesNobodyIdle) {
  create();
  fake.host.setWall(fake.host.wallNow() + std::chrono::hours{48});
  advance(719'999ms);
  EXPECT_FALSE(hasExited());
}

TEST_F(InactivityTest, AWallClockSetBackByHoursKeepsNobodyAlive) {
  create();
  fake.host.setWall(fake.host.wallNow() - std::chrono::hours{5});
  advance(720s);
  EXPECT_TRUE(hasExited());
}

TEST_F(InactivityTest, AnAgentOverWhoseIdleLimitTheHostSleptExitsWhenItWakes) {
  create();
  fake.host.sleep(359'999ms);
  EXPECT_FALSE(hasExited());
  logRecord();
  fake.host.sleep(std::chrono::hours{8});
  EXPECT_THAT(fake.processExit.exits, ElementsAre(0));
}

TEST_F(InactivityTest, AShortenedLimitIsDelayAndThresholdAtOnce) {
  fake.configuration.inactivityLimit = 300ms;
  create();
  advance(599ms);
  EXPECT_FALSE(hasExited());
  advance(1ms);
  EXPECT_TRUE(hasExited());
}

TEST_F(InactivityTest, AnEmptyRecordIsNoActivity) {
  create();
  advance(100s);
  const auto before = server->lastActivity();
  server->log({.text = ""});
  server->event({.text = std::nullopt});
  EXPECT_EQ(server->lastActivity(), before);
  EXPECT_THAT(fake.logFacility.records, IsEmpty());
}

}  // namespace
}  // namespace zal
