#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>

#include "tests/linux/stackshot/target_process.h"
#include "tests/support/child_program.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using ::testing::AllOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::MatchesRegex;
using ::testing::Not;

/// Runs the real program. What sees the whole machine runs among process ids of its own: nobody else's
/// threads are stopped by a test.
class StackshotProgramTest : public ::testing::Test {
 protected:
  int run(std::vector<std::string> command) {
    std::filesystem::remove(directory / "out");
    std::filesystem::remove(directory / "err");
    ChildProgram child(
        {.command = std::move(command), .output = directory / "out", .errors = directory / "err"});
    const auto status = child.waitForExit();
    out = readFile(directory / "out");
    err = readFile(directory / "err");
    return status.value_or(-1000);
  }
  int runProgram(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), ZAL_STACKSHOT_PATH);
    return run(std::move(arguments));
  }
  static std::vector<std::string> aloneCommand() {
    std::vector<std::string> command = {"/usr/bin/unshare"};
    if (::geteuid() != 0) command.insert(command.end(), {"--user", "--map-root-user"});
    command.insert(command.end(), {"--pid", "--fork", "--kill-child", "--mount-proc"});
    return command;
  }
  bool canBeAlone() {
    std::vector<std::string> trial = aloneCommand();
    trial.emplace_back("/bin/true");
    return run(trial) == 0;
  }
  /// The script's first argument is the program's path, the second a directory for its files.
  int runAlone(const std::string& script) {
    std::filesystem::create_directory(directory / "reports");
    std::vector<std::string> command = aloneCommand();
    command.insert(command.end(), {"/bin/sh", "-c", script, "sh", ZAL_STACKSHOT_PATH, directory / "reports"});
    return run(command);
  }
  /// The report whose path the program printed.
  [[nodiscard]] std::string report() const { return readFile(out.substr(0, out.find('\n'))); }

  TemporaryDirectory directory;
  std::string out;
  std::string err;
};

TEST_F(StackshotProgramTest, ReportsOneProcessUnderItsNameWithCodeAndMessage) {
  TargetProcess target("alone");
  ASSERT_TRUE(target.becomes("S"));
  const std::string id = std::to_string(target.id());
  EXPECT_EQ(runProgram({"--pid", id, "--code", "0xFED9E2FF", "--message", "Simulating", "--output",
                        directory / "reports/"}),
            0);
  EXPECT_EQ(err, "");
  EXPECT_THAT(out, MatchesRegex(directory / "reports/stackshot_targe-....-..-..-......\\.crash\n"));
  EXPECT_THAT(report(),
              AllOf(HasSubstr("Report of process " + id + "\n\n"), HasSubstr("Message:        Simulating\n"),
                    HasSubstr("Code:           0xFED9E2FF\n"), HasSubstr("Threads:        1, 1 stack\n"),
                    HasSubstr(" zalSleepsInTheTest + 0x"), Not(HasSubstr("Incomplete:"))));
  EXPECT_TRUE(target.isFree());
  EXPECT_TRUE(target.becomes("S"));
}

TEST_F(StackshotProgramTest, AnExceptionIsToldInTheReportOfItsProcess) {
  TargetProcess target("alone");
  ASSERT_TRUE(target.becomes("S"));
  const std::string id = std::to_string(target.id());
  EXPECT_EQ(runProgram({"--pid", id, "--exception", "broken", "--output", "-"}), 0);
  EXPECT_THAT(out, AllOf(HasSubstr("Report of an exception in process " + id + "\n\n"),
                         HasSubstr("Exception:      broken\n"), HasSubstr(" zalSleepsInTheTest + 0x")));
}

TEST_F(StackshotProgramTest, AProcessThatIsGoneLeavesNoReport) {
  TargetProcess target([] {});
  const std::string id = std::to_string(target.id());
  target.end();
  EXPECT_EQ(runProgram({"--pid", id, "--output", directory / "reports/"}), 1);
  EXPECT_EQ(err, "lirra-stackshot: there is no process " + id + "\n");
  EXPECT_EQ(listTree(directory.path()), "err\nout\n");
}

TEST_F(StackshotProgramTest, AReportThatCannotBeWrittenIsSaidToBe) {
  EXPECT_EQ(runProgram({"--pid", std::to_string(::getpid()), "--output", "/dev/null/"}), 1);
  EXPECT_THAT(err, AllOf(HasSubstr("lirra-stackshot: /dev/null/"), EndsWith(": Not a directory\n")));
}

TEST_F(StackshotProgramTest, WrongUsageAndHelp) {
  EXPECT_EQ(runProgram({"--output"}), 2);
  EXPECT_EQ(err, "lirra-stackshot: --output needs a value; see lirra-stackshot --help\n");
  EXPECT_EQ(runProgram({"--help"}), 0);
  EXPECT_THAT(out, HasSubstr("Usage: lirra-stackshot"));
}

TEST_F(StackshotProgramTest, ShowsTheWholeMachineInAFileThatADumpsCollectorTakes) {
  if (!canBeAlone()) GTEST_SKIP() << "no process ids of one's own: " << err;
  ASSERT_EQ(runAlone(R"sh(sleep 1000 & sleep 1001 &
    until [ "$(cat /proc/2/comm)$(cat /proc/3/comm)" = sleepsleep ]; do :; done
    "$1" --reason "ZalLogging Log Dump" --code 0xf33d1337 --output "$2")sh"),
            0)
      << err;
  EXPECT_THAT(out, MatchesRegex(directory / "reports/Homeframe.....-..-..-......\\.stackshot\n"));
  EXPECT_THAT(report(), AllOf(HasSubstr("Stackshot of the machine\n\n"),
                              HasSubstr("Reason:         ZalLogging Log Dump\n"),
                              HasSubstr("Code:           0xF33D1337\n"), HasSubstr("Process 1 [sh], "),
                              HasSubstr("  Command: sleep 1000\n"), HasSubstr("  Command: sleep 1001\n"),
                              HasSubstr("nanosleep"), HasSubstr("no stack: the program that writes this\n")));
}

TEST_F(StackshotProgramTest, ToldToEndItWritesWhatItHasAndLetsEverybodyGo) {
  if (!canBeAlone()) GTEST_SKIP() << "no process ids of one's own: " << err;
  // Whoever is told at any moment of its run has either written everything or says that it has not.
  ASSERT_EQ(runAlone(R"sh(n=0; while [ $n -lt 40 ]; do sleep 1000 & n=$((n + 1)); done
    for delay in 0.01 0.03 0.05; do
      "$1" --output "$2/$delay" >&2 & shot=$!
      sleep $delay; kill -TERM $shot; wait $shot
      grep -h TracerPid /proc/[0-9]*/status | sort -u
    done
    sed -n 's/^State:.\(.\).*/\1/p' /proc/[0-9]*/status | sort | uniq -c | grep -c t)sh"),
            1)
      << err;  // grep finds nobody
  EXPECT_EQ(out, "TracerPid:\t0\nTracerPid:\t0\nTracerPid:\t0\n0\n");
  for (const auto& entry : std::filesystem::directory_iterator(directory / "reports"))
    EXPECT_THAT(readFile(entry.path()), HasSubstr("\n  Command: sleep 1000\n"));
}

TEST_F(StackshotProgramTest, WithoutPrivilegeOthersAreListedWithTheReason) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the superuser can become somebody else";
  if (::access("/usr/bin/setpriv", X_OK) != 0) GTEST_SKIP() << "setpriv is not installed";
  const std::vector<std::string> nobody = {"/usr/bin/setpriv", "--reuid=65534", "--regid=65534",
                                           "--clear-groups"};
  std::vector<std::string> trial = nobody;
  trial.insert(trial.end(), {ZAL_STACKSHOT_PATH, "--help"});
  if (run(trial) != 0) GTEST_SKIP() << "nobody may not run the program where it lies: " << err;
  TargetProcess target("alone");
  ASSERT_TRUE(target.becomes("S"));
  std::vector<std::string> command = nobody;
  command.insert(command.end(), {ZAL_STACKSHOT_PATH, "--pid", std::to_string(target.id()), "--output", "-"});
  EXPECT_EQ(run(command), 0);
  EXPECT_THAT(out, AllOf(HasSubstr("Incomplete:     1 thread (Permission denied)\n"),
                         HasSubstr(" [stackshot_targe], S (sleeping)"),
                         EndsWith("    no stack: Permission denied\n\n")));
  EXPECT_TRUE(target.isFree());
}

}  // namespace
}  // namespace zal::testing
