#include <signal.h>

#include "tests/e2e/e2e_fixture.h"

namespace zal {
namespace {

using testing::eventually;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::RawClient;

/// What a running agent hears of changed preferences. Entries of an open session are the witness:
/// unlike begins and ends they do not read the preferences themselves. The console echo of records,
/// switched in the same file, tells when the agent has read it.
class PreferencesE2eTest : public testing::E2eFixture {
 protected:
  void expectSwitchedOffAndOnAgainBy(const std::function<void()>& tellTheAgent) {
    sandbox.setSwitches({"CallLogging"});
    start();
    RawClient client(sandbox.socketPath());
    client.beginSession("Vistel");
    client.sendDescription("Vistel", "before", 1714651381.0);
    ASSERT_TRUE(client.barrier());

    sandbox.setSwitches({"ConsoleOutputTorvik"});
    tellTheAgent();
    ASSERT_TRUE(eventually([&] { return isEchoing(client); }));
    client.sendDescription("Vistel", "while off", 1714651382.0);
    ASSERT_TRUE(client.barrier());

    sandbox.setSwitches({"CallLogging"});
    tellTheAgent();
    ASSERT_TRUE(eventually([&] { return !isEchoing(client); }));
    client.sendDescription("Vistel", "on again", 1714651383.0);
    ASSERT_TRUE(client.barrier());
    EXPECT_EQ(agent->terminate(), 0);
    const std::string log = sandbox.sessionFile("Vistel", "Verbose Log");
    EXPECT_THAT(log, HasSubstr("[Sender: test] before "));
    EXPECT_THAT(log, Not(HasSubstr("while off")));
    EXPECT_THAT(log, HasSubstr("[Sender: test] on again "));
  }

 private:
  bool isEchoing(RawClient& client) {
    const std::string text = "probe " + std::to_string(++_probes) + ".";
    client.sendLog("Probe", text);
    return client.barrier() && output().find(text) != std::string::npos;
  }
  int _probes = 0;
};

TEST_F(PreferencesE2eTest, SighupMakesTheAgentReadThemAgain) {
  expectSwitchedOffAndOnAgainBy([&] { agent->signal(SIGHUP); });
}

TEST_F(PreferencesE2eTest, TheNotificationMakesTheAgentReadThemAgain) {
  expectSwitchedOffAndOnAgainBy([&] { sandbox.postPreferencesChanged(); });
}

TEST_F(PreferencesE2eTest, ASessionBegunAfterCallLoggingWasSwitchedOnIsLogged) {
  sandbox.setSwitches({});
  start();
  RawClient client(sandbox.socketPath());
  client.beginSession("Nexa");
  ASSERT_TRUE(client.barrier());
  sandbox.setSwitches({"CallLogging"});
  sandbox.postPreferencesChanged();
  client.beginSession("Vistel");
  for (const char* text : {"one", "two"}) client.sendCheckpoint("Vistel", text, 1714651381.0);
  for (const char* text : {"one", "two"}) client.sendCheckpoint("Nexa", text, 1714651381.0);
  ASSERT_TRUE(client.barrier());
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("[Sender: test] two "));
  EXPECT_EQ(sandbox.sessionDirectory("Nexa"), "");
}

}  // namespace
}  // namespace zal
