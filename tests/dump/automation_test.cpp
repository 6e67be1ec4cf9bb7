#include "dump/automation.h"

#include <gmock/gmock.h>

#include <filesystem>

#include "tests/dump/recording_action_server.h"
#include "tests/support/fake_platform.h"

namespace zal {
namespace {

using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// Automation on an internal install, with the category of its lines switched on.
class AutomationTest : public ::testing::Test {
 protected:
  AutomationTest() {
    fake.configuration.internalInstall = true;
    fake.agentLog.enabledCategories.insert("Automation");
  }
  void startMessaging(const ValueMap& info) { automation.startMessaging("caller", &info, server); }
  [[nodiscard]] std::vector<std::string> alertTexts() const {
    std::vector<std::string> texts;
    for (const auto& posted : fake.userAlerts.posted) {
      const UserAlert& alert = posted.alert;
      EXPECT_EQ(alert.identifier, "Automation");
      EXPECT_EQ(alert.defaultButton, "OK");
      EXPECT_EQ(alert.alternateButton, std::nullopt);
      EXPECT_EQ(alert.otherButton, std::nullopt);
      EXPECT_FALSE(alert.textField);
      EXPECT_FALSE(posted.listener);
      texts.push_back(alert.title + ": " + alert.message);
    }
    return texts;
  }
  /// Once the queue has carried them out.
  const std::vector<std::string>& commands() {
    fake.queues.runAll();
    return fake.shell.commands;
  }
  /// What the last command was given behind "-h".
  [[nodiscard]] std::string commandFor(const std::string& target) {
    fake.shell.commands.clear();
    startMessaging({{"target", target}});
    return commands().empty() ? "(none)" : commands().front();
  }
  static std::string commandWith(const std::string& word) {
    return "/usr/bin/nohup /usr/local/bin/zaltool -w automation-test -s Quillet -h " + word +
           " -t 10 -i 5 -d 400 &";
  }

  testing::FakePlatform fake;
  Automation automation{fake.platform};
  testing::RecordingActionServer server;
};

TEST_F(AutomationTest, VideoCallsStartInTheBackgroundAndWriteIntoTheReportRoot) {
  fake.configuration.roots.DiagnosticReportRoot = "/nowhere/mobile/Reports";
  automation.startVideoCalls("caller", server);
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("log:Automation: Starting automation on behalf of: caller"));
  EXPECT_THAT(commands(), ElementsAre("/usr/bin/nohup /usr/local/etc/runnelUI/general/callstress.js >> "
                                      "/nowhere/mobile/Reports/CallRunLog.txt &"));
  EXPECT_THAT(server.calls, ElementsAre("automation runs"));
  EXPECT_THAT(alertTexts(), ElementsAre("Vistel Automation: Started Vistel automation"));
}

TEST_F(AutomationTest, AReportRootInTheHomeIsWrittenOutAndAnOddOneQuoted) {
  fake.configuration.roots.DiagnosticReportRoot = "~/Logs of $(me)";
  automation.startVideoCalls("caller", server);
  const std::string home = std::filesystem::canonical(fake.home.path()).string();
  EXPECT_THAT(commands(), ElementsAre("/usr/bin/nohup /usr/local/etc/runnelUI/general/callstress.js >> '" +
                                      home + "/Logs of $(me)/CallRunLog.txt' &"));
}

TEST_F(AutomationTest, NobodyWaitsForACommandAndTheyKeepTheirOrder) {
  automation.startVideoCalls("caller", server);
  automation.stopVideoCalls("caller", server);
  EXPECT_THAT(fake.shell.commands, IsEmpty());
  EXPECT_THAT(server.calls, ElementsAre("automation runs", "automation stopped"));
  EXPECT_THAT(commands(), ElementsAre(::testing::HasSubstr("callstress.js"), "/usr/bin/killall -9 runnel"));
}

TEST_F(AutomationTest, VideoCallsStop) {
  automation.stopVideoCalls("caller", server);
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("log:Automation: Stopping automation on behalf of: caller"));
  EXPECT_THAT(commands(), ElementsAre("/usr/bin/killall -9 runnel"));
  EXPECT_THAT(server.calls, ElementsAre("automation stopped"));
  EXPECT_THAT(alertTexts(), ElementsAre("Vistel Automation: Stopped Vistel automation"));
}

TEST_F(AutomationTest, MessagingStartsWithTheTarget) {
  startMessaging(
      {{"target", "kim@example.com"}, {"repetitions", std::int64_t{25}}, {"interval", std::int64_t{30}}});
  const std::string command =
      "/usr/bin/nohup /usr/local/bin/zaltool -w automation-test -s Quillet -h kim@example.com -t 25 -i 30 -d "
      "400 &";
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:Automation: Starting Quillet automation on behalf of: caller",
                          "log:Automation: Starting zaltool automation: " + command));
  EXPECT_THAT(commands(), ElementsAre(command));
  EXPECT_THAT(server.calls, ElementsAre("automation runs"));
  EXPECT_THAT(alertTexts(),
              ElementsAre("Quillet Automation: Starting Quillet automation with: kim@example.com"));
}

TEST_F(AutomationTest, Repetitions3AndInterval1RunTheToolWith10And5) {
  startMessaging({{"target", "kim"}, {"repetitions", std::int64_t{3}}, {"interval", std::int64_t{1}}});
  startMessaging({{"target", "kim"}});
  startMessaging({{"target", "kim"}, {"repetitions", std::int64_t{-20}}, {"interval", std::int64_t{-20}}});
  EXPECT_THAT(commands(), ElementsAre(commandWith("kim"), commandWith("kim"), commandWith("kim")));
}

TEST_F(AutomationTest, MessagingDoesNotStartWithoutATarget) {
  startMessaging({});
  startMessaging({{"target", ""}});
  startMessaging({{"target", std::int64_t{5}}});
  automation.startMessaging("caller", nullptr, server);
  const std::string refusal = "Quillet Automation: Not starting automation, no target was specified";
  EXPECT_THAT(alertTexts(), ElementsAre(refusal, refusal, refusal, refusal));
  const std::string line = "log:Automation: Starting Quillet automation on behalf of: caller";
  EXPECT_THAT(fake.agentLog.lines, ElementsAre(line, line, line, line));
  EXPECT_THAT(commands(), IsEmpty());
  EXPECT_THAT(server.calls, IsEmpty());
}

TEST_F(AutomationTest, MessagingStartsOnInternalInstallsOnly) {
  fake.configuration.internalInstall = false;
  startMessaging({{"target", "kim"}});
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(commands(), IsEmpty());
  EXPECT_THAT(server.calls, IsEmpty());
}

TEST_F(AutomationTest, MessagingStopsOnAnyInstall) {
  fake.configuration.internalInstall = false;
  automation.stopMessaging("caller", server);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:Automation: Stopping Quillet automation on behalf of: caller"));
  EXPECT_THAT(commands(), ElementsAre("/usr/bin/killall -9 zaltool"));
  EXPECT_THAT(server.calls, ElementsAre("automation stopped"));
  EXPECT_THAT(alertTexts(), ElementsAre("Quillet Automation: Stopped Quillet automation"));
}

TEST_F(AutomationTest, AStartWhileOneRunsStartsASecond) {
  automation.startVideoCalls("caller", server);
  automation.startVideoCalls("caller", server);
  EXPECT_EQ(commands().size(), 2U);
}

TEST_F(AutomationTest, ASenderWithoutANameIsCalledSo) {
  automation.stopVideoCalls(std::nullopt, server);
  automation.stopMessaging("", server);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:Automation: Stopping automation on behalf of: No Sender",
                          "log:Automation: Stopping Quillet automation on behalf of: No Sender"));
}

TEST_F(AutomationTest, AHostileTargetIsOneWordToTheShell) {
  EXPECT_EQ(commandFor("$(touch X)"), commandWith("'$(touch X)'"));
  EXPECT_EQ(commandFor("`touch X`"), commandWith("'`touch X`'"));
  EXPECT_EQ(commandFor("'; touch X; '"), commandWith("''\\''; touch X; '\\'''"));
  EXPECT_EQ(commandFor("\"; touch X; \""), commandWith("'\"; touch X; \"'"));
  EXPECT_EQ(commandFor("a\ntouch X"), commandWith("'a\ntouch X'"));
  EXPECT_EQ(commandFor("-x"), commandWith("-x"));
  EXPECT_EQ(commandFor("../.."), commandWith("'../..'"));
  EXPECT_EQ(commandFor("/etc/passwd"), commandWith("'/etc/passwd'"));
  EXPECT_EQ(commandFor("\xEF\xBF\xBD"), commandWith("'\xEF\xBF\xBD'"));
  EXPECT_EQ(commandFor(std::string(4096, 'a')), commandWith(std::string(4096, 'a')));
  EXPECT_EQ(commandFor("kim\0; touch X"s), commandWith("kim"));
  EXPECT_EQ(commandFor("\0; touch X"s), "(none)");
}

TEST_F(AutomationTest, AHostileTextIsOneLineInTheLogAndPlainInTheAlert) {
  const ValueMap info{{"target", "a\nwarning: b"}};
  automation.startMessaging("x\ny", &info, server);
  EXPECT_THAT(fake.agentLog.lines,
              ElementsAre("log:Automation: Starting Quillet automation on behalf of: x?y",
                          "log:Automation: Starting zaltool automation: " + commandWith("'a?warning: b'")));
  EXPECT_THAT(alertTexts(),
              ElementsAre("Quillet Automation: Starting Quillet automation with: a\nwarning: b"));
}

}  // namespace
}  // namespace zal
