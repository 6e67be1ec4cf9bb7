#include <unistd.h>

#include "client/lirra.hpp"
#include "platform/linux/notifications/notification_file.h"
#include "tests/e2e/dump_fixture.h"
#include "tests/support/private_bus.h"

namespace zal {
namespace {

using ::testing::ContainsRegex;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using testing::linesOf;
using testing::PrivateBus;
using testing::readFile;
using testing::writeFile;

bool inTime(const std::function<bool()>& condition) {
  return testing::eventually(condition, testing::kDeadline);
}

/// The shell blocks of docs/bus.md.
std::vector<std::string> shellBlocks() {
  std::vector<std::string> blocks;
  bool inside = false;
  for (const std::string& line : linesOf(readFile(ZAL_BUS_PAGE))) {
    if (line.starts_with("```")) {
      inside = line == "```sh";
      if (inside) blocks.emplace_back();
    } else if (inside) {
      blocks.back() += line + "\n";
    }
  }
  return blocks;
}

/// The real daemon on a bus of the test's own, which is both of its buses.
class AgentOnTheBusE2eTest : public testing::DumpFixture {
 protected:
  void SetUp() override {
    if (const std::string obstacle = PrivateBus::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
    for (const char* tool : {"busctl", "gdbus"}) {
      if (!std::filesystem::exists("/usr/bin/" + std::string(tool)))
        GTEST_SKIP() << tool << " is not installed";
    }
    bus = std::make_unique<PrivateBus>("system", busPolicy());
    sandbox.bus = bus->address();
  }
  [[nodiscard]] virtual std::string busPolicy() const { return PrivateBus::kEverythingAllowed; }

  void startOnBus() {
    start();
    ASSERT_TRUE(inTime([this] { return bus->hasOwner("com.vendel.lirra"); }));
  }
  [[nodiscard]] std::map<std::string, std::string> busVariables() const {
    return {{"DBUS_SYSTEM_BUS_ADDRESS", bus->address()}, {"DBUS_SESSION_BUS_ADDRESS", bus->address()}};
  }
  [[nodiscard]] std::string shell(const std::string& commands) const {
    return testing::outputOf({"/bin/sh", "-e", "-c", commands}, busVariables());
  }
  [[nodiscard]] std::string request(const std::vector<std::string>& words) const {
    std::vector<std::string> all{
        "call", "com.vendel.lirra", "/com/vendel/lirra", "com.vendel.Lirra", "Request", "a{sv}"};
    all.insert(all.end(), words.begin(), words.end());
    return bus->busctl(all);
  }
  /// A record of that type; its log set shows that it arrived.
  [[nodiscard]] std::string record(const std::string& type) const {
    return request({"4", "__ipc__event_code__", "x", "15", "logString", "s", "by the bus", "type", "s", type,
                    "sender", "s", "busctl"});
  }

  std::unique_ptr<PrivateBus> bus;
};

TEST_F(AgentOnTheBusE2eTest, ThePageIsTrue) {
  startOnBus();
  testing::TemporaryDirectory outputs;
  std::vector<std::unique_ptr<testing::ChildProgram>> monitors;
  std::vector<std::string> answers;
  std::vector<std::string> others;
  for (const std::string& block : shellBlocks()) {
    if (block.find(" monitor ") == std::string::npos) {
      others.push_back(block);
      continue;
    }
    const std::string name = outputs / (block.starts_with("busctl") ? "busctl" : "gdbus");
    monitors.push_back(std::make_unique<testing::ChildProgram>(
        testing::ChildProgram::Options{.command = {"/bin/sh", "-c", "exec " + block},
                                       .output = name,
                                       .errors = name + ".errors",
                                       .environment = busVariables()}));
  }
  ASSERT_EQ(monitors.size(), 2U);
  // Neither says when it has begun to listen; both show what is posted once they do.
  ASSERT_TRUE(inTime([&] {
    EXPECT_EQ(record("Probe"), "a{sv} 0");
    EXPECT_EQ(bus->busctl({"emit", "/com/vendel/lirra", "com.vendel.Lirra", "Probe"}), "");
    return readFile(outputs / "busctl").find("Probe") != std::string::npos &&
           readFile(outputs / "gdbus").find("is owned by") != std::string::npos;
  }));
  for (const std::string& block : others) answers.push_back(shell(block));

  ASSERT_EQ(answers.size(), 6U);
  EXPECT_EQ(answers[0], "a{sv} 0");
  EXPECT_EQ(answers[1], "a{sv} 0\na{sv} 0\na{sv} 0");
  EXPECT_EQ(answers[2], "a{sv} 0");
  const std::string reports = sandbox.reportRoot();
  EXPECT_THAT(answers[3], ::testing::MatchesRegex(
                              "a\\{sv\\} 2 \"action\" x 14 \"replyResult\" a\\{sv\\} 2 \"logPath\" s \"" +
                              reports + "/Vistel/Vistel-Log .*zip\" \"replyAction\" x 14"));
  EXPECT_THAT(
      answers[4],
      ContainsRegex("^\\(@a\\{sv\\} \\{\\},\\)\n\\(@a\\{sv\\} \\{\\},\\)\n\\(@a\\{sv\\} \\{\\},\\)\n"
                    "\\(\\{'action': <int64 14>, 'replyResult': <\\{'logPath': <'" +
                    reports + "/Messages/Messages-Log .*zip'>, 'replyAction': <int64 14>\\}>\\},\\)$"));
  EXPECT_EQ(answers[5], "");
  EXPECT_TRUE(inTime(
      [&] { return readFile(outputs / "busctl").find("kLirraSyncLoggingPrefs") != std::string::npos; }));
  EXPECT_THAT(readFile(outputs / "busctl"), HasSubstr("Member=LirraLoggingDumpComplete"));
  EXPECT_THAT(readFile(outputs / "busctl"), HasSubstr("STRING \"done\";"));
  EXPECT_THAT(readFile(outputs / "gdbus"), HasSubstr("com.vendel.Lirra.LirraLoggingDumpComplete ('"));
  EXPECT_THAT(
      readFile(outputs / "gdbus"),
      ContainsRegex(
          "com.vendel.Lirra.Progress \\('.*', 'Vistel', 'begin', uint32 0, uint32 [0-9]+, '', ''\\)"));

  ASSERT_TRUE(inTime([&] { return reportsEndingWith(" (Initiator).zip").size() == 1; }));
  const std::string session = reportsEndingWith(" (Initiator).zip").at(0);
  const auto text = [&](const std::string& log) {
    for (const std::string& entry : entriesOf(session)) {
      if (entry.starts_with(log)) return textIn(session, entry);
    }
    return std::string();
  };
  EXPECT_THAT(text("Log ("), HasSubstr("[Sender: me] Invite sent"));
  EXPECT_THAT(text("Verbose Log ("), HasSubstr("Iface\tDestination"));
  EXPECT_THAT(text("Quality Log ("), HasSubstr("rtt-ms"));
}

TEST_F(AgentOnTheBusE2eTest, ACallStartsTheAgentWhichIdlesOutAndIsStartedAgain) {
  sandbox.settings = "[testing]\ninactivityLimit = 1.0\n";
  sandbox.writeConfiguration();
  std::string command = "/usr/bin/env -i";
  for (const std::string& variable : sandbox.environment()) command += " \"" + variable + "\"";
  writeFile(sandbox / "agent.sh",
            "#!/bin/sh\nexec " + command + " " ZAL_AGENT_PATH " >> " + sandbox.outputFile() + " 2>&1\n");
  std::filesystem::permissions(sandbox / "agent.sh", std::filesystem::perms::owner_all);
  writeFile(bus->servicesDirectory() + "/com.vendel.lirra.service",
            "[D-BUS Service]\nName=com.vendel.lirra\nExec=" + (sandbox / "agent.sh") + "\n");
  for (int round = 1; round <= 2; ++round) {
    EXPECT_FALSE(bus->hasOwner("com.vendel.lirra"));
    EXPECT_EQ(record("Activated"), "a{sv} 0");
    EXPECT_EQ(linesOf(sandbox.wholeLogSet("Activated")).size(), static_cast<std::size_t>(round));
    ASSERT_TRUE(inTime([this] { return !bus->hasOwner("com.vendel.lirra"); }));
  }
  EXPECT_EQ(output(), "");
}

TEST_F(AgentOnTheBusE2eTest, ABusThatDiesTakesNothingWithItAndTheNameComesBack) {
  sandbox.settings = "[testing]\nclosingStageDelay = 3600\n";
  startOnBus();
  testing::RawClient client(sandbox.socketPath());
  client.beginSession("Vistel", 4);
  bus->kill();
  ASSERT_TRUE(inTime([this] {
    return output().find("The system bus is lost") != std::string::npos ||
           output().find("The session bus is lost") != std::string::npos;
  }));
  client.sendCheckpoint("Vistel", "without a bus", 1714651388.5);
  client.sendDescription("Vistel", "still talking", 1714651389.5);
  ASSERT_TRUE(client.barrier());
  sandbox.setSwitches({"CallLogging", "ConsoleOutputTorvik"});
  sandbox.postPreferencesChanged();
  // The switch is on once what is logged shows on the console.
  ASSERT_TRUE(inTime([&] {
    EXPECT_TRUE(client.sendLog("Console", "echoed"));
    EXPECT_TRUE(client.barrier());
    return output().find("echoed") != std::string::npos;
  }));
  bus->start();
  ASSERT_TRUE(inTime([this] { return bus->hasOwner("com.vendel.lirra"); }));
  EXPECT_EQ(record("Back"), "a{sv} 0");
  EXPECT_EQ(linesOf(sandbox.wholeLogSet("Back")).size(), 1U);
  sandbox.setSwitches({"CallLogging"});
  ASSERT_TRUE(inTime([&] {
    EXPECT_EQ(bus->busctl({"emit", "/com/vendel/lirra", "com.vendel.Lirra", "kLirraSyncLoggingPrefs"}), "");
    const std::size_t before = output().size();
    EXPECT_TRUE(client.sendLog("Console", "silent?"));
    EXPECT_TRUE(client.barrier());
    return output().size() == before;
  })) << "the notification is heard from the new bus";
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(sandbox.sessionFile("Vistel", "Log"), HasSubstr("without a bus"));
}

TEST_F(AgentOnTheBusE2eTest, HostileDictionariesHurtNobody) {
  sandbox.logSettings += "categories = [\"IPC\"]\n";
  startOnBus();
  EXPECT_EQ(request({"2", "__ipc__event_code__", "s", "0", "sessionType", "x", "7"}), "a{sv} 0");
  EXPECT_EQ(request({"1", "__ipc__event_code__", "t", "18446744073709551615"}), "a{sv} 0");
  EXPECT_EQ(request({"2", "__ipc__event_code__", "x", "9", "userInfo", "a{sv}", "1", "collectionFlags", "as",
                     "1", "x"}),
            "a{sv} 0");
  std::string deep = "<'deep'>";
  for (int i = 0; i < 20; ++i) deep = "<{'k': " + deep + "}>";
  EXPECT_THAT(shell("gdbus call --system --dest com.vendel.lirra --object-path /com/vendel/lirra --method "
                    "com.vendel.Lirra.Request \"{'d': " +
                    deep + "}\" || true"),
              HasSubstr("LimitsExceeded"));
  EXPECT_EQ(record("Alive"), "a{sv} 0");
  EXPECT_EQ(linesOf(sandbox.wholeLogSet("Alive")).size(), 1U);
  EXPECT_EQ(agent->terminate(), 0);
}

TEST_F(AgentOnTheBusE2eTest, CallersThatWaitForADumpHearOfTheTermination) {
  sandbox.logSettings += "categories = [\"IPC\"]\n";
  startOnBus();
  holdSecondStage();
  testing::ChildProgram caller({.command = {"/usr/bin/env",
                                            "busctl",
                                            "--address=" + bus->address(),
                                            "--timeout=600",
                                            "call",
                                            "com.vendel.lirra",
                                            "/com/vendel/lirra",
                                            "com.vendel.Lirra",
                                            "Request",
                                            "a{sv}",
                                            "4",
                                            "__ipc__event_code__",
                                            "x",
                                            "9",
                                            "action",
                                            "x",
                                            "14",
                                            "session",
                                            "s",
                                            "Vistel",
                                            "userInfo",
                                            "a{sv}",
                                            "2",
                                            "displayFlags",
                                            "x",
                                            "2",
                                            "collectionFlags",
                                            "x",
                                            "4"}});
  const std::string peer = "peer(" + std::to_string(caller.processId()) + ")";
  ASSERT_TRUE(inTime([&] { return output().find("received message from " + peer) != std::string::npos; }));
  EXPECT_EQ(agent->terminate(), 0);
  EXPECT_THAT(output(), HasSubstr(peer + " received IPC_ERROR_TERMINATION_IMMINENT"));
  EXPECT_NE(caller.waitForExit(), 0) << "no reply";
}

/// A bus that refuses as the system's does, with the policy that is installed.
class InstalledPolicyE2eTest : public AgentOnTheBusE2eTest {
 protected:
  [[nodiscard]] std::string busPolicy() const override {
    return "<policy context=\"default\"><allow user=\"*\"/><deny own=\"*\"/><deny send_type=\"method_call\"/>"
           "<allow send_type=\"signal\"/><allow send_requested_reply=\"true\" send_type=\"method_return\"/>"
           "<allow send_requested_reply=\"true\" send_type=\"error\"/><allow receive_type=\"method_call\"/>"
           "<allow receive_type=\"method_return\"/><allow receive_type=\"error\"/><allow "
           "receive_type=\"signal\"/>"
           "<allow send_destination=\"org.freedesktop.DBus\"/></policy><include>" ZAL_BUS_POLICY "</include>";
  }
  void SetUp() override {
    if (::geteuid() != 0) GTEST_SKIP() << "needs the superuser";
    AgentOnTheBusE2eTest::SetUp();
    if (bus != nullptr) bus->letEverybodyConnect();
  }
  [[nodiscard]] std::vector<std::string> asNobody(std::vector<std::string> words) const {
    words.insert(words.begin(),
                 {"/usr/bin/env", "setpriv", "--reuid=65534", "--regid=65534", "--clear-groups"});
    return words;
  }
};

TEST_F(InstalledPolicyE2eTest, TheSuperuserIsServedAndAStrangerIsNot) {
  startOnBus();
  EXPECT_EQ(record("Policy"), "a{sv} 0");
  EXPECT_THAT(testing::outputOf(asNobody({"busctl", "--address=" + bus->address(), "call", "com.vendel.lirra",
                                          "/com/vendel/lirra", "com.vendel.Lirra", "Request", "a{sv}", "0"})),
              HasSubstr("Access denied"));
}

TEST_F(InstalledPolicyE2eTest, AStrangerHearsTheNotificationsButNotWhereDumpsLie) {
  startOnBus();
  testing::TemporaryDirectory outputs;
  const testing::ChildProgram monitor(
      {.command = asNobody({"gdbus", "monitor", "--system", "--dest", "com.vendel.lirra"}),
       .output = outputs / "heard",
       .errors = outputs / "errors",
       .environment = busVariables()});
  ASSERT_TRUE(inTime([&] { return readFile(outputs / "heard").find("is owned by") != std::string::npos; }));
  for (int i = 0; i < 2; ++i) {
    EXPECT_THAT(request({"4", "__ipc__event_code__", "x", "9", "action", "x", "14", "session", "s", "Policy",
                         "userInfo", "a{sv}", "2", "collectionFlags", "x", "0", "displayFlags", "x", "2"}),
                HasSubstr("logPath"));
  }
  EXPECT_TRUE(inTime(
      [&] { return readFile(outputs / "heard").find("LirraLoggingDumpComplete") != std::string::npos; }));
  EXPECT_EQ(readFile(outputs / "heard").find("Progress"), std::string::npos);
}

TEST_F(InstalledPolicyE2eTest, AStrangerMayHaveThePreferencesReadAgain) {
  startOnBus();
  testing::RawClient client(sandbox.socketPath());
  sandbox.setSwitches({"ConsoleOutputTorvik"});
  ASSERT_TRUE(inTime([&] {
    EXPECT_EQ(testing::outputOf(asNobody({"gdbus", "emit", "--system", "--object-path", "/com/vendel/lirra",
                                          "--signal", "com.vendel.Lirra.kLirraSyncLoggingPrefs"}),
                                busVariables()),
              "");
    EXPECT_TRUE(client.sendLog("Console", "echoed"));
    EXPECT_TRUE(client.barrier());
    return output().find("echoed") != std::string::npos;
  }));
}

}  // namespace
}  // namespace zal
