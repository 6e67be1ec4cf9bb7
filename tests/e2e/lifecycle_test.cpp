#include <signal.h>

#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using testing::AgentProcess;
using ::testing::EndsWith;
using testing::eventually;
using ::testing::HasSubstr;
using testing::RawClient;

class AgentLifecycleE2eTest : public testing::E2eFixture {
 protected:
  static bool hasSocketActivation() { return std::filesystem::exists("/usr/bin/systemd-socket-activate"); }
};

TEST_F(AgentLifecycleE2eTest, AnAgentWithoutAnythingToDoEndsWithStatus0) {
  sandbox.settings = "[testing]\ninactivityLimit = 0.3\n";
  start();
  EXPECT_EQ(agent->waitForExit(), 0);
}

TEST_F(AgentLifecycleE2eTest, ItIsStartedOnDemandServesItsFirstClientAndIdlesOut) {
  if (!hasSocketActivation()) GTEST_SKIP() << "systemd-socket-activate is not installed";
  sandbox.settings = "[testing]\ninactivityLimit = 0.5\n";
  AgentProcess::Options options;
  options.waitUntilListening = false;
  options.launcher = {"/usr/bin/systemd-socket-activate", "--listen=" + sandbox.socketPath()};
  for (const std::string& variable : sandbox.environment())
    options.launcher.push_back("--setenv=" + variable);
  start(options);
  // The launcher binds before it listens, so the first tries may find nobody.
  std::unique_ptr<RawClient> client;
  ASSERT_TRUE(eventually([&] {
    try {
      client = std::make_unique<RawClient>(sandbox.socketPath());
    } catch (const std::runtime_error&) {
    }
    return client != nullptr;
  }));
  ASSERT_TRUE(client->sendLog("Demand", "first words"));
  ASSERT_TRUE(client->barrier());
  EXPECT_THAT(sandbox.wholeLogSet("Demand"), EndsWith("[test:e2e] first words\n"));
  EXPECT_EQ(agent->waitForExit(), 0);
  EXPECT_TRUE(client->waitUntilClosed());
  EXPECT_TRUE(std::filesystem::exists(sandbox.socketPath())) << "the socket is the launcher's";
}

TEST_F(AgentLifecycleE2eTest, ASecondAgentOnTheSameSocketNamesTheHolderAndEndsWithStatus0) {
  start();
  AgentProcess::Options options;
  options.waitUntilListening = false;
  AgentProcess second(sandbox, options);
  EXPECT_EQ(second.waitForExit(), 0);
  EXPECT_THAT(output(), HasSubstr("is held by process " + std::to_string(agent->processId())));
  EXPECT_THAT(output(), HasSubstr("Connection went invalid, exiting"));
  RawClient client(sandbox.socketPath());
  EXPECT_TRUE(client.barrier()) << "the first one goes on";
}

TEST_F(AgentLifecycleE2eTest, AnAgentThatFindsNoDescriptorsSaysSoAndEndsWithStatus1) {
  AgentProcess::Options options;
  options.waitUntilListening = false;
  // Whoever runs the tests may have left some open.
  options.launcher = {"/bin/sh", "-c",
                      R"(exec 3>&- 4>&- 5>&- 6>&- 7>&- 8>&- 9>&-; ulimit -n 4 && exec "$0" "$@")"};
  start(options);
  EXPECT_EQ(agent->waitForExit(), 1);
  EXPECT_THAT(output(), HasSubstr("zalloggingagent: cannot start: "));
}

TEST_F(AgentLifecycleE2eTest, ASocketLeftByAKilledAgentIsReplaced) {
  start();
  agent->signal(SIGKILL);
  EXPECT_EQ(agent->waitForExit(), -SIGKILL);
  EXPECT_TRUE(std::filesystem::exists(sandbox.socketPath()));
  start();
  RawClient client(sandbox.socketPath());
  EXPECT_TRUE(client.barrier());
}

TEST_F(AgentLifecycleE2eTest, OptionsGoBeforeTheEnvironment) {
  AgentProcess::Options options;
  options.waitUntilListening = false;
  options.arguments = {"--socket", sandbox / "run/other.socket",
                       "--config=" + (sandbox / "config/other.toml")};
  testing::writeFile(sandbox / "config/other.toml",
                     "[testing]\ninactivityLimit = nonsense\n[log]\njournal = false\n");
  start(options);
  EXPECT_TRUE(eventually([&] { return RawClient::canConnect(sandbox / "run/other.socket"); }));
  EXPECT_FALSE(RawClient::canConnect(sandbox.socketPath()));
  EXPECT_THAT(output(), HasSubstr(sandbox / "config/other.toml:2"));
}

TEST_F(AgentLifecycleE2eTest, HelpAndVersionAreAnsweredAndAWrongLineIsRefused) {
  const std::pair<std::string, std::pair<int, std::string>> cases[] = {
      {"--version", {0, "zalloggingagent 0.1.0\n"}},
      {"--help", {0, "Usage: zalloggingagent [--config FILE] [--socket PATH]"}},
      {"--nonsense", {2, "There is no option --nonsense; try --help.\n"}},
  };
  for (const auto& [argument, expected] : cases) {
    AgentProcess::Options options;
    options.waitUntilListening = false;
    options.arguments = {argument};
    start(options);
    EXPECT_EQ(agent->waitForExit(), expected.first);
    EXPECT_THAT(output(), HasSubstr(expected.second));
  }
}

TEST_F(AgentLifecycleE2eTest, SigtermDuringASessionWritesItsFilesAndExitsWith0) {
  start();
  RawClient client(sandbox.socketPath());
  client.beginSession("Vistel", 4);
  client.sendCheckpoint("Vistel", "Connected", 1714651388.5);
  client.sendDescription("Vistel", "still talking", 1714651389.5);
  ASSERT_TRUE(client.barrier());
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_TRUE(client.waitUntilClosed());
  EXPECT_THAT(sandbox.sessionDirectory("Vistel"), EndsWith("(CEST) (Initiator)"));
  const auto lines = testing::linesOf(testing::withoutTimes(sandbox.sessionFile("Vistel", "Verbose Log")));
  ASSERT_GE(lines.size(), 4U);
  EXPECT_THAT(
      std::vector<std::string>(lines.end() - 4, lines.end()),
      ::testing::ElementsAre("[Sender: test] Connected   [TIME]", "[Sender: test] still talking   [TIME]",
                             "[Sender: test] Begin Session  [TIME]", "[Sender: ENDALL] End Session  [TIME]"));
  EXPECT_FALSE(std::filesystem::exists(sandbox.socketPath()));
}

TEST_F(AgentLifecycleE2eTest, PeersThatAreConnectedHearOfTheTermination) {
  sandbox.logSettings += "categories = [\"IPC\"]\n";
  start();
  RawClient first(sandbox.socketPath());
  RawClient second(sandbox.socketPath());
  ASSERT_TRUE(first.barrier());
  ASSERT_TRUE(second.barrier());
  EXPECT_EQ(agent->terminate(), 0);
  const std::string line = "peer(" + std::to_string(::getpid()) + ") received IPC_ERROR_TERMINATION_IMMINENT";
  const std::string text = output();
  const std::size_t once = text.find(line);
  ASSERT_NE(once, std::string::npos);
  EXPECT_NE(text.find(line, once + 1), std::string::npos) << "each peer hears it";
}

}  // namespace
}  // namespace zal
