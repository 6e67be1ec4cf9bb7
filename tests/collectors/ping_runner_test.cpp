#include "collectors/ping_runner.h"

#include <gtest/gtest.h>

#include <memory>

#include "tests/support/fake_services.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/scripted_pings.h"

namespace zal {
namespace {

using Lines = std::vector<std::string>;

class PingRunnerTest : public ::testing::Test {
 protected:
  PingRunnerTest() { log.enabledCategories.insert("Ping"); }
  void add(double duration, bool useWifi = false) {
    runner->addPingTest("198.51.100.7", duration, useWifi, std::nullopt);
  }
  testing::ScriptedPings::Test& test(std::size_t index) { return *pings.tests.at(index); }

  testing::ManualRunLoop loop;
  testing::ManualWorkQueues queues{loop};
  testing::ScriptedPings pings;
  testing::RecordingAgentLog log;
  std::unique_ptr<_ZalLoggingAgentPingRunner> runner =
      std::make_unique<_ZalLoggingAgentPingRunner>(queues, pings, log);
};

TEST_F(PingRunnerTest, RequestWithoutAnAddressPingsTheDefaultGateway) {
  runner->addPingTest(std::nullopt, 8.0, true, std::nullopt);
  queues.runAll();
  EXPECT_EQ(test(0).address, kDefaultGatewayAddress);
  EXPECT_TRUE(test(0).wifi);
}

TEST_F(PingRunnerTest, DurationOfZeroOrLessUsesTheTestsLongInterval) {
  add(0);
  add(-1.0);
  queues.runAll();
  EXPECT_EQ(test(0).seconds, 60.0);
  EXPECT_EQ(test(1).seconds, 60.0);
}

TEST_F(PingRunnerTest, DurationOfEightSecondsIsUsedAsItIs) {
  add(8.0);
  queues.runAll();
  EXPECT_EQ(test(0).seconds, 8.0);
}

TEST_F(PingRunnerTest, DirectoryWithoutAFileNameWritesNoResultsAndTheTestStillRunsAndLogs) {
  runner->addPingTest("198.51.100.7", 8.0, false, "/tmp", std::nullopt);
  runner->addPingTest("198.51.100.7", 8.0, false, std::nullopt, "ping.log");
  queues.runAll();
  test(0).finish("all well", true);
  test(1).finish("all well", true);
  queues.runAll();
  EXPECT_TRUE(test(0).written.empty());
  EXPECT_TRUE(test(1).written.empty());
  EXPECT_EQ(log.lines, Lines(2, "log:Ping: Finishing ping test 198.51.100.7, useWifi = 0, all well"));
}

TEST_F(PingRunnerTest, DirectoryAndFileNameAreJoinedWithOneSlashWhateverTheDirectoryEndsWith) {
  runner->addPingTest("198.51.100.7", 8.0, false, "/tmp/", "ping.log");
  runner->addPingTest("198.51.100.7", 8.0, false, "/tmp", "ping.log");
  queues.runAll();
  test(0).finish("", true);
  test(1).finish("", true);
  queues.runAll();
  EXPECT_EQ(test(0).written, Lines{"/tmp//ping.log"});
  EXPECT_EQ(test(1).written, Lines{"/tmp/ping.log"});
}

TEST_F(PingRunnerTest, StopAllTestsStopsSixteenSecondsNotFifteenAndEmptiesTheList) {
  add(15.0);
  add(16.0);
  runner->stopAllTests();
  queues.runAll();
  EXPECT_FALSE(test(0).stopped);
  EXPECT_TRUE(test(1).stopped);
  test(0).stopped = test(1).stopped = false;
  test(0).seconds = 16.0;
  runner->stopAllTests();
  queues.runAll();
  EXPECT_FALSE(test(0).stopped);
  EXPECT_FALSE(test(1).stopped);
}

TEST_F(PingRunnerTest, StopAllTestsStopsAFinishedLongTestToo) {
  add(16.0);
  queues.runAll();
  test(0).finish("", true);
  queues.runAll();
  runner->stopAllTests();
  queues.runAll();
  EXPECT_TRUE(test(0).stopped);
}

TEST_F(PingRunnerTest, TestsAddedBackToBackAreStartedInTheOrderAdded) {
  runner->addPingTest("first", 8.0, true, std::nullopt);
  runner->addPingTest("second", 8.0, false, std::nullopt);
  EXPECT_TRUE(pings.tests.empty());
  EXPECT_TRUE(queues.runNext("com.vendel.lirra.pingqueue"));
  ASSERT_EQ(pings.tests.size(), 1U);
  EXPECT_EQ(test(0).address, "first");
  EXPECT_TRUE(test(0).started);
  EXPECT_TRUE(queues.runNext("com.vendel.lirra.pingqueue"));
  EXPECT_EQ(test(1).address, "second");
  EXPECT_TRUE(test(1).started);
}

TEST_F(PingRunnerTest, WifiTestsCompleteOnTheirOwnQueueAndOthersOnTheTestQueue) {
  add(8.0, true);
  add(8.0, false);
  queues.runAll();
  EXPECT_EQ(test(0).queueLabel, "com.vendel.zallogging.pingqueue");
  EXPECT_EQ(test(1).queueLabel, "com.vendel.lirra.pingqueue");
}

TEST_F(PingRunnerTest, FailedTestWritesItsFileFirstAndThenLogsTheFailure) {
  runner->addPingTest("198.51.100.7", 8.0, true, "/tmp/out.log");
  queues.runAll();
  test(0).finish("8 packets transmitted, 0 received", false);
  queues.runAll();
  EXPECT_EQ(test(0).written, Lines{"/tmp/out.log"});
  EXPECT_EQ(log.lines, (Lines{"log:Ping: Finishing ping test 198.51.100.7, useWifi = 1, "
                              "8 packets transmitted, 0 received",
                              "log:Ping: Encountered errors pinging address 198.51.100.7"}));
}

TEST_F(PingRunnerTest, FailureToWriteNamesTheErrorAndNotThePath) {
  runner->addPingTest("198.51.100.7", 8.0, false, "/tmp/out.log");
  queues.runAll();
  test(0).writeFails = true;
  test(0).finish("r", false);
  queues.runAll();
  EXPECT_EQ(log.lines, (Lines{"log:Ping: Finishing ping test 198.51.100.7, useWifi = 0, r",
                              "log:Ping: Couldn't write ping results to file disk is full",
                              "log:Ping: Encountered errors pinging address 198.51.100.7"}));
}

TEST_F(PingRunnerTest, ForgottenTestStillCompletesAndWritesItsFile) {
  runner->addPingTest("198.51.100.7", 15.0, false, "/tmp/out.log");
  runner->stopAllTests();
  queues.runAll();
  test(0).finish("r", true);
  queues.runAll();
  EXPECT_EQ(test(0).written, Lines{"/tmp/out.log"});
}

TEST_F(PingRunnerTest, QueuedAndRunningTestsOutliveTheRunner) {
  runner->addPingTest("198.51.100.7", 8.0, false, "/tmp/out.log");
  queues.runAll();
  add(8.0);
  runner.reset();
  queues.runAll();
  ASSERT_EQ(pings.tests.size(), 2U);
  test(0).finish("r", true);
  queues.runAll();
  EXPECT_EQ(test(0).written, Lines{"/tmp/out.log"});
}

TEST_F(PingRunnerTest, FinishedAndForgottenTestIsFreed) {
  add(8.0);
  queues.runAll();
  const std::weak_ptr<testing::ScriptedPings::Test> watch = pings.tests.at(0);
  test(0).finish("r", true);
  runner->stopAllTests();
  queues.runAll();
  pings.tests.clear();
  EXPECT_TRUE(watch.expired());
}

TEST_F(PingRunnerTest, SharedInstanceIsTheOneThatTheEntryNamed) {
  EXPECT_EQ(_ZalLoggingAgentPingRunner::sharedInstance(), nullptr);
  _ZalLoggingAgentPingRunner::setSharedInstance(runner.get());
  EXPECT_EQ(_ZalLoggingAgentPingRunner::sharedInstance(), runner.get());
  _ZalLoggingAgentPingRunner::setSharedInstance(nullptr);
  EXPECT_EQ(_ZalLoggingAgentPingRunner::sharedInstance(), nullptr);
}

}  // namespace
}  // namespace zal
