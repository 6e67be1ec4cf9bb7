#include "platform/linux/crash/linux_crash_reporter.h"

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <iterator>
#include <sstream>
#include <thread>

#include "tests/support/child_program.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class LinuxCrashReporterTest : public ::testing::Test {
 protected:
  LinuxCrashReporterTest() { helperIs("printf '%s\\n' \"$@\" >\"$0.arguments\"; echo /the/report"); }

  /// The helper becomes a script of its own.
  void helperIs(const std::string& script) {
    writeFile(helper, "#!/bin/sh\n" + script + "\n");
    ::chmod(helper.c_str(), 0755);
  }
  [[nodiscard]] std::string arguments() const { return readFile(helper + ".arguments"); }
  /// Runs the loop until the log has so many lines.
  void awaitLines(std::size_t count) {
    EXPECT_TRUE(eventually([&] {
      loop.restart();
      loop.poll();
      return log.lines.size() >= count;
    }));
  }
  /// No process of ours is left, a buried one neither.
  static bool hasNoChild() { return ::waitpid(-1, nullptr, WNOHANG) < 0 && errno == ECHILD; }

  TemporaryDirectory directory;
  std::string helper = directory / "lirra-stackshot";
  asio::io_context loop;
  RecordingAgentLog log;
  LinuxCrashReporter reporter{loop, log, {.helper = helper, .reportDirectory = directory / "reports"}};
};

TEST_F(LinuxCrashReporterTest, AStackshotIsAskedForWithReasonAndCode) {
  EXPECT_TRUE(reporter.stackshot("ZalLogging Log Dump", 0xF33D1337));
  EXPECT_THAT(log.lines, IsEmpty());
  awaitLines(1);
  EXPECT_THAT(log.lines, ElementsAre("notice: Crash service: wrote /the/report"));
  EXPECT_EQ(arguments(),
            "--code\n4080866103\n--reason\nZalLogging Log Dump\n--output\n" + (directory / "reports/\n"));
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, AProcessIsAskedForWithCodeAndMessage) {
  EXPECT_TRUE(reporter.simulateCrash(4321, 0xFED9E2FF, "Simulating \"$(x)\""));
  awaitLines(1);
  EXPECT_EQ(arguments(), "--pid\n4321\n--code\n4275692287\n--message\nSimulating \"$(x)\"\n--output\n" +
                             (directory / "reports/\n"));
}

TEST_F(LinuxCrashReporterTest, ProcessZeroAndBelowAreRefused) {
  EXPECT_FALSE(reporter.simulateCrash(0, 1, "m"));
  EXPECT_FALSE(reporter.simulateCrash(-1, 1, "m"));
  EXPECT_THAT(log.lines,
              ElementsAre("warning: Crash service: no report of process 0: there is no such process",
                          "warning: Crash service: no report of process -1: there is no such process"));
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, AMissingHelperIsOneLineAndFalse) {
  std::filesystem::remove(helper);
  EXPECT_FALSE(reporter.stackshot("reason", 1));
  EXPECT_THAT(log.lines,
              ElementsAre("warning: Crash service: no stackshot: " + helper + ": No such file or directory"));
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, WhatAHelperThatFailsHadToSayIsInTheLog) {
  helperIs("echo 'lirra-stackshot: there is no process 5' >&2; exit 1");
  EXPECT_TRUE(reporter.simulateCrash(5, 1, "m"));
  awaitLines(1);
  EXPECT_THAT(log.lines, ElementsAre("warning: Crash service: no report of process 5: lirra-stackshot: there "
                                     "is no process 5"));
  helperIs("kill -9 $$");
  EXPECT_TRUE(reporter.stackshot("reason", 1));
  awaitLines(2);
  EXPECT_EQ(log.lines[1], "warning: Crash service: no stackshot: ended by signal 9");
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, AHelperThatHangsHoldsNobodyUpAndOnlySoManyRunAtOnce) {
  helperIs("echo $$ >>\"$0.ids\"; exec sleep 1000");
  for (int run = 0; run < LinuxCrashReporter::kMostAtOnce; ++run) {
    EXPECT_TRUE(reporter.stackshot("reason", 1));
  }
  loop.poll();
  EXPECT_THAT(log.lines, IsEmpty());
  EXPECT_FALSE(reporter.stackshot("reason", 1));
  EXPECT_THAT(log.lines, ElementsAre("warning: Crash service: no stackshot: 3 are being made"));
  std::vector<pid_t> helpers;
  EXPECT_TRUE(eventually([&] {
    std::istringstream ids(readFile(helper + ".ids"));
    helpers.assign(std::istream_iterator<pid_t>(ids), {});
    return helpers.size() == LinuxCrashReporter::kMostAtOnce;
  }));
  for (const pid_t id : helpers) ::kill(id, SIGKILL);
  awaitLines(4);
  EXPECT_EQ(log.lines[3], "warning: Crash service: no stackshot: ended by signal 9");
  helperIs("echo /the/report");
  EXPECT_TRUE(reporter.stackshot("reason", 1));
  awaitLines(5);
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, TextsAreCutToWhatFitsAndEndAtAZeroByte) {
  EXPECT_TRUE(reporter.stackshot(std::string(1'000'000, 'x'), 1));
  awaitLines(1);
  EXPECT_EQ(arguments(),
            "--code\n1\n--reason\n" + std::string(8192, 'x') + "\n--output\n" + (directory / "reports/\n"));
  EXPECT_TRUE(reporter.stackshot(std::string_view("a\0--output", 10), 1));
  awaitLines(2);
  EXPECT_EQ(arguments(), "--code\n1\n--reason\na\n--output\n" + (directory / "reports/\n"));
}

TEST_F(LinuxCrashReporterTest, TheHelperHasNothingOfOursButItsOutputs) {
  helperIs("readlink /proc/self/fd/0 >\"$0.arguments\"; ls /proc/self/fd | wc -l >>\"$0.arguments\"; echo r");
  EXPECT_TRUE(reporter.stackshot("reason", 1));
  awaitLines(1);
  EXPECT_EQ(arguments(), "/dev/null\n4\n");  // ls has the directory open, too
}

TEST_F(LinuxCrashReporterTest, MayBeAskedOnAnyThread) {
  std::thread([&] { EXPECT_TRUE(reporter.stackshot("reason", 1)); }).join();
  awaitLines(1);
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, AnExceptionsReportIsThereWhenTheCallReturns) {
  helper = ZAL_STACKSHOT_PATH;
  LinuxCrashReporter real(loop, log, {.helper = helper, .reportDirectory = directory / "reports"});
  EXPECT_TRUE(real.simulateCrashForException("broken task"));
  ASSERT_EQ(log.lines.size(), 1U);
  const std::string said = "notice: Crash service: wrote ";
  EXPECT_THAT(log.lines[0],
              MatchesRegex(said + (directory / "reports/linux_crash_tes-....-..-..-......\\.crash")));
  EXPECT_THAT(readFile(log.lines[0].substr(said.size())),
              AllOf(HasSubstr("Report of an exception in process " + std::to_string(::getpid()) + "\n"),
                    HasSubstr("Exception:      broken task\n"), HasSubstr(" zal::LinuxCrashReporter::"),
                    HasSubstr(" main + 0x")));
  EXPECT_TRUE(hasNoChild());
}

TEST_F(LinuxCrashReporterTest, ARunThatIsDroppedWithItsLoopGoesOn) {
  helperIs("sleep 0.2; echo >\"$0.arguments\"");
  {
    asio::io_context shortLived;
    LinuxCrashReporter dropped(shortLived, log, {.helper = helper, .reportDirectory = directory.path()});
    EXPECT_TRUE(dropped.stackshot("reason", 1));
  }
  EXPECT_TRUE(eventually([&] { return arguments() == "\n"; }));
  EXPECT_THAT(log.lines, IsEmpty());
  EXPECT_TRUE(eventually([] { return ::waitpid(-1, nullptr, WNOHANG) != 0; }));
}

}  // namespace
}  // namespace zal::testing
