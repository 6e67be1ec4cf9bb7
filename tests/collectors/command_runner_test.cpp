#include "collectors/command_runner.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

class CommandRunnerTest : public ::testing::Test {
 protected:
  testing::ScriptedShell shell;
  CommandRunner runner{shell};
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

}  // namespace
}  // namespace zal
