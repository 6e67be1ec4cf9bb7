#include "platform/linux/bus/alerts/notification_screen.h"

#include <gmock/gmock.h>

#include <sstream>

#include "tests/linux/bus/bus_fixture.h"

namespace zal::testing {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::StartsWith;

constexpr const char* kName = "org.freedesktop.Notifications";

/// A played notification server, whose person is the test.
class NotificationScreenTest : public BusFixture {
 protected:
  void SetUp() override {
    BusFixture::SetUp();
    if (IsSkipped()) return;
    if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  }
  void startServer(const std::string& capabilities = "body actions body-markup") {
    server.emplace(bus, kName,
                   std::vector<std::string>{"-m", "dbusmock", "--session", "-l", directory / "calls", "-t",
                                            "notification_daemon", "-p",
                                            R"({"capabilities": ")" + capabilities + "\"}"});
  }
  void emit(const std::string& signal, std::uint32_t number, const std::vector<std::string>& last) const {
    std::vector<std::string> words{"call",
                                   kName,
                                   "/org/freedesktop/Notifications",
                                   "org.freedesktop.DBus.Mock",
                                   "EmitSignal",
                                   "sssav",
                                   kName,
                                   signal,
                                   "u" + last.front(),
                                   "2",
                                   "u",
                                   std::to_string(number)};
    words.insert(words.end(), last.begin(), last.end());
    ASSERT_EQ(bus.busctl(words), "");
  }
  void press(std::uint32_t number, const std::string& key) const {
    emit("ActionInvoked", number, {"s", key});
  }
  void close(std::uint32_t number, int reason) const {
    emit("NotificationClosed", number, {"u", std::to_string(reason)});
  }
  static UserAlert question(const std::string& title = "Title") {
    UserAlert alert;
    alert.title = title;
    alert.message = "a & b";
    alert.defaultButton = "OK";
    alert.alternateButton = "Cancel";
    alert.level = 3;
    return alert;
  }
  static UserAlert notice() {
    UserAlert alert = question();
    alert.alternateButton.reset();
    alert.level = 0;
    return alert;
  }
  void present(const std::string& id, const UserAlert& alert) {
    screen->present(id, alert,
                    {.onAnswer =
                         [this, id](const AlertAnswer& answer) {
                           told.push_back(id + " " + std::to_string(answer.code));
                         },
                     .onDeclined = [this, id] { told.push_back(id + " declined"); }});
  }
  /// What the newest server was asked, without the times; GetCapabilities aside.
  std::vector<std::string> calls() const {
    std::vector<std::string> result;
    std::istringstream lines(readFile(directory / "calls"));
    for (std::string line; std::getline(lines, line);) {
      line.erase(0, line.find(' ') + 1);
      if (line.starts_with("Notify ") || line.starts_with("CloseNotification ")) result.push_back(line);
    }
    return result;
  }
  std::unique_ptr<NotificationScreen> makeScreen(NotificationScreen::Limits limits) {
    return std::make_unique<NotificationScreen>(host, connection, limits);
  }
  /// For servers and buses that do not answer.
  void useShortLimits() {
    screen = makeScreen({.call = std::chrono::milliseconds(200), .patience = std::chrono::milliseconds(400)});
  }
  void runUntilCalls(std::size_t count) {
    ASSERT_TRUE(runUntil([&] { return calls().size() >= count; }));
    // The answer to the last one.
    runFor(std::chrono::milliseconds(20));
  }
  void runUntilTold(std::size_t count) {
    ASSERT_TRUE(runUntil([&] { return told.size() >= count; }));
  }

  TemporaryDirectory directory;
  BusConnection connection{host, host.sessionBus, "session bus"};
  std::unique_ptr<NotificationScreen> screen = makeScreen({});
  std::optional<MockedService> server;
  std::vector<std::string> told;
};

TEST_F(NotificationScreenTest, AnAlertIsOneNotificationWithItsButtons) {
  startServer();
  present("7", question());
  runUntilCalls(1);
  EXPECT_THAT(calls(), ElementsAre("Notify \"ZalLoggingAgent\" 0 \"dialog-question\" \"Title\" \"a &amp; b\" "
                                   "[\"default\", \"OK\", \"alternate\", \"Cancel\"] {\"urgency\": 2} 0"));
  EXPECT_THAT(told, IsEmpty());
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(NotificationScreenTest, AnActionIsTheAnswerOnceAndOnlyOfTheAlertItBelongsTo) {
  startServer();
  present("7", question());
  present("8", question());
  runUntilCalls(2);
  press(99, "default");
  press(1, "inline-reply");
  press(1, "other");
  press(2, "alternate");
  press(2, "default");
  close(2, 2);
  press(1, "default");
  runUntilTold(2);
  runFor(std::chrono::milliseconds(20));
  EXPECT_THAT(told, ElementsAre("8 1", "7 0"));
}

TEST_F(NotificationScreenTest, ClosedByThePersonIsCancelledAndExpiredIsNoAnswer) {
  startServer();
  for (const char* const id : {"1", "2", "3", "4"}) present(id, question());
  runUntilCalls(4);
  close(1, 1);
  close(3, 3);
  close(4, 4);
  close(2, 2);
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("2 3"));
}

TEST_F(NotificationScreenTest, WithdrawnIsClosedAndNobodyIsTold) {
  startServer();
  present("7", question());
  runUntilCalls(1);
  screen->withdraw("7");
  screen->withdraw("7");
  runUntilCalls(2);
  EXPECT_THAT(calls()[1], "CloseNotification 1");
  EXPECT_THAT(calls(), SizeIs(2));
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(NotificationScreenTest, WithdrawnBeforeTheServerAnsweredItIsClosedAsSoonAsItHasANumber) {
  startServer();
  present("6", question());
  runUntilCalls(1);
  server->hang();
  present("7", question());
  runFor(std::chrono::milliseconds(20));
  screen->withdraw("7");
  server->goOn();
  runUntilCalls(3);
  EXPECT_EQ(calls()[2], "CloseNotification 2");
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(NotificationScreenTest, AtTheEndOfTheAgentQuestionsAreClosedAtOnceAndNoticesStay) {
  startServer();
  present("7", question());
  present("8", notice());
  runUntilCalls(2);
  screen->agentEnds();
  // Without another turn of the loop: the process ends here.
  ASSERT_TRUE(eventually([&] { return calls().size() == 3; }));
  EXPECT_EQ(calls()[2], "CloseNotification 1");
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(NotificationScreenTest, ATextFieldIsForDialogs) {
  startServer();
  UserAlert alert = question();
  alert.textField = UserAlert::TextField{};
  present("7", alert);
  EXPECT_THAT(told, ElementsAre("7 declined"));
  EXPECT_THAT(calls(), IsEmpty());
}

TEST_F(NotificationScreenTest, AServerWithoutActionsIsNoPlaceToAnswer) {
  startServer("body");
  present("7", question());
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("7 declined"));
  EXPECT_THAT(calls(), IsEmpty());
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(NotificationScreenTest, WithoutAServerItIsDeclinedAndNoneIsStarted) {
  writeFile(
      bus.servicesDirectory() + "/server.service",
      "[D-BUS Service]\nName=" + std::string(kName) + "\nExec=/bin/touch " + (directory / "started") + "\n");
  bus.kill();
  bus.start();
  present("7", question());
  runUntilTold(1);
  present("8", question());
  runUntilTold(2);
  screen->agentEnds();
  EXPECT_THAT(told, ElementsAre("7 declined", "8 declined"));
  EXPECT_FALSE(std::filesystem::exists(directory / "started"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(NotificationScreenTest, WithoutABusItIsDeclinedAtOnce) {
  bus.kill();
  present("7", question());
  EXPECT_THAT(told, ElementsAre("7 declined"));
}

TEST_F(NotificationScreenTest, AServerThatHangsHoldsUpNobodyAndItIsSaidOnce) {
  startServer();
  useShortLimits();
  server->hang();
  EXPECT_EQ(strayWaitsDuring([this] {
              present("7", question());
              present("8", question());
              runUntilTold(2);
            }),
            0U);
  EXPECT_THAT(told, ElementsAre("7 declined", "8 declined"));
  EXPECT_THAT(log.lines, ElementsAre(StartsWith("warning: The notification server cannot show an alert: ")));
  server->goOn();
  screen = makeScreen({});
  present("9", question());
  runUntilCalls(1);
  press(1, "default");
  runUntilTold(3);
  EXPECT_EQ(told.back(), "9 0");
}

TEST_F(NotificationScreenTest, ABusThatHangsHoldsUpNobody) {
  startServer();
  useShortLimits();
  present("7", question());
  runUntilCalls(1);
  bus.hang();
  EXPECT_EQ(strayWaitsDuring([this] {
              present("8", question());
              screen->withdraw("7");
              runUntilTold(1);
            }),
            0U);
  EXPECT_THAT(told, ElementsAre("8 declined"));
  bus.goOn();
}

TEST_F(NotificationScreenTest, AfterAServersEndTheNextOneShowsWhatStillWaits) {
  startServer();
  present("7", question("waits"));
  present("8", question("answered"));
  runUntilCalls(2);
  press(2, "default");
  runUntilTold(1);
  server->kill();
  runFor(std::chrono::milliseconds(50));
  startServer();
  runUntilCalls(1);
  EXPECT_THAT(calls()[0], StartsWith("Notify \"ZalLoggingAgent\" 0 \"dialog-question\" \"waits\""));
  press(1, "alternate");
  runUntilTold(2);
  EXPECT_THAT(told, ElementsAre("8 0", "7 1"));
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(NotificationScreenTest, AfterTheBusCameBackTheNextServerShowsWhatStillWaits) {
  startServer();
  present("7", question());
  runUntilCalls(1);
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return connection.connection() == nullptr; }));
  bus.start();
  startServer();
  runUntilCalls(1);
  press(1, "default");
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("7 0"));
}

TEST_F(NotificationScreenTest, AfterAReconnectionTheSameServerIsNotAskedTwice) {
  startServer();
  present("7", question());
  runUntilCalls(1);
  int reconnected = 0;
  const auto user = connection.addUser({.onConnected = [&](sdbus::IConnection&) { ++reconnected; },
                                        .signals = {{"type='signal',member='Nothing'", [](auto&) {}}}});
  ASSERT_TRUE(runUntil([&] { return reconnected == 1; }));
  present("8", question());
  runUntilCalls(2);
  press(1, "alternate");
  press(2, "default");
  runUntilTold(2);
  EXPECT_THAT(told, ElementsAre("7 1", "8 0"));
  EXPECT_THAT(calls(), SizeIs(2));
}

TEST_F(NotificationScreenTest, AServerThatAnswersNonsenseIsDeclined) {
  server.emplace(bus, kName,
                 std::vector<std::string>{"-m", "dbusmock", "--session", kName,
                                          "/org/freedesktop/Notifications", kName});
  ASSERT_EQ(bus.busctl({"call", kName, "/org/freedesktop/Notifications", "org.freedesktop.DBus.Mock",
                        "AddMethod", "sssss", kName, "GetCapabilities", "", "i", "ret = 7"}),
            "");
  present("7", question());
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("7 declined"));
  EXPECT_THAT(log.lines, SizeIs(1));
}

TEST_F(NotificationScreenTest, WithNothingOnTheScreenOtherProgramsNotificationsWakeNobody) {
  startServer();
  present("7", question());
  runUntilCalls(1);
  const auto rules = [this] {
    const std::string text = bus.busctl({"call", "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                         "org.freedesktop.DBus.Debug.Stats", "GetAllMatchRules"});
    std::size_t count = 0;
    for (std::size_t at = text.find(kName); at != std::string::npos; at = text.find(kName, at + 1)) ++count;
    return count;
  };
  if (rules() == 0) GTEST_SKIP() << "this bus daemon does not tell its match rules";
  screen->withdraw("7");
  EXPECT_TRUE(runUntil([&] { return rules() == 0; }));
}

TEST_F(NotificationScreenTest, ABusThatHangsHoldsUpTheLoopNeitherWithANewAlertNorWithTheNext) {
  startServer();
  useShortLimits();
  present("7", question());
  runUntilCalls(1);
  screen->withdraw("7");
  runUntilCalls(2);
  bus.hang();
  const unsigned strayWaits = strayWaitsDuring([&] {
    present("8", question());
    runUntilTold(1);
    present("9", question());
    runUntilTold(2);
  });
  bus.goOn();
  EXPECT_EQ(strayWaits, 0U);
  EXPECT_THAT(told, ElementsAre("8 declined", "9 declined"));
}

TEST_F(NotificationScreenTest, TheScreenMayGoWithAlertsOnIt) {
  startServer();
  present("7", question());
  screen.reset();
  runFor(std::chrono::milliseconds(50));
  EXPECT_THAT(told, IsEmpty());
}

}  // namespace
}  // namespace zal::testing
