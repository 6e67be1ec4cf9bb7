#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class UsageTest : public ToolFixture {};

TEST_F(UsageTest, NoCommandIsWrongUsage) {
  EXPECT_EQ(run({}), 2);
  EXPECT_EQ(err, "A subcommand is required\nRun with --help for more information.\n");
}

TEST_F(UsageTest, WrongArgumentsAreWrongUsageAndSendNothing) {
  startAgent();
  const std::vector<std::vector<std::string>> wrong = {
      {"frobnicate"},
      {"checkpoint", "Vistel"},
      {"checkpoint", "Vistel", "a", "b"},
      {"pulse", "Vistel", "--nonsense"},
      {"pulse", "Vistel", "--timeout", "soon"},
      {"checkpoint", "Vistel", "x", "--time", "-1"},
      {"metric", "Vistel", "m", "1", "--kind", "complex"},
      {"prefs"},
      {"prefs", "set", "CallLogging", "maybe"},
      {"sessions", "show", "--log", "--verbose"},
  };
  for (const auto& arguments : wrong) {
    EXPECT_EQ(run(arguments), 2) << arguments.back();
    EXPECT_NE(err, "") << arguments.back();
  }
  EXPECT_TRUE(agent->requests().empty());
}

TEST_F(UsageTest, HelpTeachesWithExamplesAndExitCodes) {
  EXPECT_EQ(run({"--help"}), 0);
  EXPECT_EQ(err, "");
  EXPECT_NE(out.find("lirractl begin Vistel --initiator"), std::string::npos);
  EXPECT_NE(out.find("  3  not found: a session, a preference, an alert, a file"), std::string::npos);
}

TEST_F(UsageTest, EveryCommandHasAHelpWithAnExample) {
  for (const char* command : {"begin", "end",      "checkpoint", "describe", "info",    "quality", "metric",
                              "file",  "pulse",    "initiator",  "receiver", "failure", "log",     "event",
                              "prefs", "sessions", "status",     "dump",     "action",  "alerts"}) {
    EXPECT_EQ(run({command, "--help"}), 0) << command;
    EXPECT_NE(out.find("Example"), std::string::npos) << command;
    EXPECT_NE(out.find(std::string("lirractl ") + command), std::string::npos) << command;
  }
}

TEST_F(UsageTest, VersionIsPrinted) {
  EXPECT_EQ(run({"--version"}), 0);
  EXPECT_EQ(out, "lirractl " + std::string(LIRRA_VERSION) + "\n");
}

}  // namespace
}  // namespace zal::testing
