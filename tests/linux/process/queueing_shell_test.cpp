#include "platform/linux/process/queueing_shell.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"

namespace zal::testing {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class QueueingShellTest : public ::testing::Test {
 protected:
  ScriptedShell shell;
  ManualRunLoop host;
  ManualWorkQueues queues{host};
  QueueingShell queueing{shell, queues};
};

TEST_F(QueueingShellTest, ItsOwnThreadDoesNotWaitForBackgroundLinesAndTheirOrderStays) {
  queueing.performSystemInBackground("one &");
  queueing.performSystemInBackground("two &");
  EXPECT_THAT(shell.commands, IsEmpty());
  queues.runAll();
  EXPECT_THAT(shell.commands, ElementsAre("one &", "two &"));
}

TEST_F(QueueingShellTest, AForegroundLineIsWaitedFor) {
  shell.respond = [](const std::string&) { return 256; };
  EXPECT_EQ(queueing.PerformSystem("killall reader"), 256);
  EXPECT_THAT(shell.commands, ElementsAre("killall reader"));
}

TEST_F(QueueingShellTest, OtherThreadsRunTheirLinesThemselves) {
  std::thread([&] { queueing.performSystemInBackground("three &"); }).join();
  EXPECT_THAT(shell.commands, ElementsAre("three &"));
}

TEST_F(QueueingShellTest, AtTheEndWhatWasAcceptedIsStarted) {
  queueing.performSystemInBackground("last &");
  std::thread worker([&] { queues.runAll(); });
  queueing.startWhatIsQueued();
  worker.join();
  EXPECT_THAT(shell.commands, ElementsAre("last &"));
  queueing.startWhatIsQueued();  // nothing left: returns at once
}

}  // namespace
}  // namespace zal::testing
