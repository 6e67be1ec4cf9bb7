#include <unistd.h>

#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class StatusTest : public ToolFixture {
 protected:
  const std::string kRest =
      "socket                 ROOT/agent\n"
      "configuration          none; the defaults hold\n"
      "preferences            /config/com.vendel.logging.toml\n"
      "sessions are logged    no; \"lirractl prefs set CallLogging true\" turns it on\n"
      "UserLogRoot            \n"
      "MobileLogRoot          \n"
      "DiagnosticReportRoot   ROOT/Reports\n"
      "WirelessLogRoot        \n"
      "WirelessReportRoot     \n"
      "RootReportRoot         \n"
      "SystemLogRoot          \n"
      "SystemReportRoot       \n"
      "NetworkConfigRoot      \n"
      "TemporaryRoot          /tmp\n"
      "RuntimeRoot            \n";
};

TEST_F(StatusTest, RunningAgentIsShownWithItsProcess) {
  startAgent();
  EXPECT_EQ(run({"status"}), 0);
  EXPECT_EQ(plain(out),
            "agent                  process " + std::to_string(::getpid()) + " answered in 0.0 ms\n" + kRest);
  EXPECT_EQ(err, "");
}

TEST_F(StatusTest, AgentThatIsNotRunningIsToldWithHowToStartIt) {
  EXPECT_EQ(run({"status"}), 1);
  EXPECT_EQ(plain(out), "agent                  none answers\n" + kRest);
  EXPECT_EQ(plain(err),
            "lirractl: the agent is not running: ROOT/agent: No such file or directory\n"
            "  Start it with \"zalloggingagent &\" or \"systemctl --user start zalloggingagent.socket\"; "
            "another socket "
            "is named with --socket.\n");
}

TEST_F(StatusTest, WarningsOfTheConfigurationAreShown) {
  startAgent();
  machine.toolSettings.configurationFile = "/config/lirra.toml";
  machine.toolSettings.warnings = {"/config/lirra.toml:3: unknown key x"};
  EXPECT_EQ(run({"status"}), 0);
  EXPECT_EQ(err, "lirractl: /config/lirra.toml:3: unknown key x\n");
}

TEST_F(StatusTest, ForProgramsItIsOneObject) {
  startAgent();
  machine.toolSettings.warnings = {"w"};
  EXPECT_EQ(run({"status", "--json"}), 0);
  EXPECT_EQ(
      plain(out),
      R"({"running": true, "process": )" + std::to_string(::getpid()) +
          R"(, "answeredInMs": 0.0, "socket": "ROOT/agent", "configuration": "", )"
          R"("preferences": "/config/com.vendel.logging.toml", "roots": {"UserLogRoot": "", "MobileLogRoot": "", )"
          R"("DiagnosticReportRoot": "ROOT/Reports", "WirelessLogRoot": "", "WirelessReportRoot": "", )"
          R"("RootReportRoot": "", "SystemLogRoot": "", "SystemReportRoot": "", "NetworkConfigRoot": "", )"
          R"("TemporaryRoot": "/tmp", "RuntimeRoot": ""}, "warnings": ["w"]})"
          "\n");
}

TEST_F(StatusTest, ForProgramsAMissingAgentIsOneObjectToo) {
  EXPECT_EQ(run({"status", "--json"}), 1);
  const std::string beginning =
      R"({"running": false, "trouble": "the agent cannot be reached", "reason": "ROOT/agent: No such file or directory", )";
  EXPECT_EQ(plain(out).substr(0, beginning.size()), beginning);
}

}  // namespace
}  // namespace zal::testing
