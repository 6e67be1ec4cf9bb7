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

TEST_F(StatusTest, ShowsWhatClientsHaveOfTheMemoryOfTheAgentThatAnswered) {
  startAgent();
  machine.agentMemory =
      MemoryView{::getpid(), 5U << 20U, {{4711, 1000, 3U << 20U, 17, true}, {4712, 0, 1U << 19U, 0, false}}};
  EXPECT_EQ(run({"status"}), 0);
  EXPECT_EQ(
      plain(out),
      "agent                  process " + std::to_string(::getpid()) +
          " answered in 0.0 ms\n"
          "memory                 5.0 MiB of lines\n"
          "                       3.0 MiB of it from process 4711 of user 1000; 17 of its messages were "
          "delayed; it waits\n"
          "                       0.5 MiB of it from process 4712 of user 0; 0 of its messages were "
          "delayed\n" +
          kRest);
  machine.agentMemory->agent = ::getpid() + 1;
  EXPECT_EQ(run({"status"}), 0);
  EXPECT_EQ(plain(out).find("MiB"), std::string::npos);
}

TEST_F(StatusTest, ForProgramsMemoryIsAnObjectToo) {
  startAgent();
  machine.agentMemory = MemoryView{::getpid(), 500, {{4711, 1000, 300, 17, true}}};
  EXPECT_EQ(run({"status", "--json"}), 0);
  EXPECT_NE(
      plain(out).find(
          R"("answeredInMs": 0.0, "memory": {"bytes": 500, "clients": [{"process": 4711, "user": 1000, )"
          R"("bytes": 300, "delayedMessages": 17, "waits": true}]}, "socket")"),
      std::string::npos);
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
