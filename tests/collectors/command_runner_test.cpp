#include "collectors/command_runner.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"

namespace zal {
namespace {

class CommandRunnerTest : public ::testing::Test {
 protected:
  testing::ScriptedShell shell;
  testing::PlainFilePlacement files{"/"};
  testing::RecordingAgentLog log;
  CommandRunner runner{shell, files, log};
};

TEST_F(CommandRunnerTest, BackgroundCommandHasItsWholeOutputInTheFileAndIsNotWaitedFor) {
  runner.RunCommandInBackground("netstat -rn", "/tmp/a dump", "netstat.txt");
  EXPECT_EQ(shell.commands, std::vector<std::string>{"netstat -rn > \"/tmp/a dump/netstat.txt\"  2>&1 &"});
}

TEST_F(CommandRunnerTest, AwaitedCommandHasNoAmpersand) {
  runner.RunCommandAndWait("/usr/local/bin/horvand getReferenceTime", "/tmp", "time-file.txt");
  EXPECT_EQ(shell.commands, std::vector<std::string>{
                                "/usr/local/bin/horvand getReferenceTime > \"/tmp/time-file.txt\"  2>&1"});
}

TEST_F(CommandRunnerTest, CommandLineIsNotQuoted) {
  runner.RunCommandAndWait("echo `date` | tr \"a\" 'b'", "/d", "f");
  EXPECT_EQ(shell.commands, std::vector<std::string>{"echo `date` | tr \"a\" 'b' > \"/d/f\"  2>&1"});
}

TEST_F(CommandRunnerTest, StatusOfTheShellIsIgnored) {
  shell.respond = [](const std::string&) { return -1; };
  runner.RunCommandInBackground("missing-tool", "/d", "f");
  runner.RunCommandAndWait("missing-tool", "/d", "f");
  EXPECT_EQ(shell.commands.size(), 2U);
}

TEST_F(CommandRunnerTest, DirectoryNamedByAClientStaysTextForTheShell) {
  runner.RunCommandInBackground("top", "/logs/\";reboot;\"$(id)`id`\\", "f$x");
  EXPECT_EQ(shell.commands,
            std::vector<std::string>{R"(top > "/logs/\";reboot;\"\$(id)\`id\`\\/f\$x"  2>&1 &)"});
}

TEST_F(CommandRunnerTest, AnOutputThatIsSomebodyElsesLeavesItsCommandOutAndTheRestGoesOn) {
  files.refuseOutput = [](const std::string& path) {
    return path == "/tmp/planted" ? std::make_error_code(std::errc::operation_not_permitted)
                                  : std::error_code{};
  };
  runner.RunCommandInBackground("one", "/tmp", "planted");
  EXPECT_FALSE(runner.RunCommandAndWait("two", "/tmp", "planted"));
  EXPECT_TRUE(runner.RunCommandAndWait("three", "/tmp", "free"));
  EXPECT_EQ(shell.commands, std::vector<std::string>{"three > \"/tmp/free\"  2>&1"});
  const std::string line =
      "warning: Somebody else's file is in the way at /tmp/planted and cannot be removed (Operation not "
      "permitted); the command is left out";
  EXPECT_EQ(log.lines, (std::vector<std::string>{line, line}));
}

}  // namespace
}  // namespace zal
