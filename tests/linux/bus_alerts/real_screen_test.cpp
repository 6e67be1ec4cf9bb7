// What a person sees and does, with the programs that people have.

#include <gmock/gmock.h>

#include <filesystem>

#include "platform/linux/alerts/alert_file.h"
#include "platform/linux/alerts/alert_screens.h"
#include "platform/linux/alerts/runtime_alert_store.h"
#include "platform/linux/bus/alerts/notification_screen.h"
#include "platform/linux/dialog/dialog_screen.h"
#include "tests/linux/alerts/problem_prompt.h"
#include "tests/linux/bus/bus_fixture.h"
#include "tests/linux/bus_alerts/virtual_display.h"

namespace zal::testing {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class RealScreenTest : public BusFixture {
 protected:
  void SetUp() override {
    BusFixture::SetUp();
    if (IsSkipped()) return;
    if (const std::string obstacle = VirtualDisplay::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
    display.emplace();
    store.showOn(screens);
  }
  void startNotificationServer() {
    if (!std::filesystem::exists("/usr/bin/dunst")) GTEST_SKIP() << "dunst is not installed";
    dunst.emplace(ChildProgram::Options{
        .command = {"/usr/bin/dunst"},
        .environment = {{"DBUS_SESSION_BUS_ADDRESS", bus.address()}, {"HOME", directory.path()}}});
    ASSERT_TRUE(eventually([this] { return bus.hasOwner("org.freedesktop.Notifications"); }));
  }
  static UserAlert completion() {
    UserAlert alert;
    alert.identifier = "CopyLogs";
    alert.title = "Vistel Logging";
    alert.message =
        "Logs have been successfully captured and stored in this file: Vistel-Log "
        "(2026-11-20 20-50-00) (no sound <b> & more).zip";
    alert.defaultButton = "OK";
    return alert;
  }
  void post(UserAlert alert) {
    store.post(std::move(alert), [this](const AlertResponse& response) {
      const auto* const text = response.textFieldValue.as<std::string>();
      told.push_back(std::to_string(response.code) + (text != nullptr ? " " + *text : ""));
    });
  }
  std::string awaitWindow(const std::string& windowClass) {
    std::string window;
    EXPECT_TRUE(runUntil([&] { return !(window = display->windowOf(windowClass)).empty(); }));
    return window;
  }
  void awaitNoWindow(const std::string& windowClass) {
    EXPECT_TRUE(runUntil([&] { return display->windowOf(windowClass).empty(); }));
  }
  /// The prompt's window, ready for the keyboard.
  std::string awaitPrompt() {
    if (!std::filesystem::exists("/usr/bin/zenity")) return "";
    const std::string window = awaitWindow("zenity");
    display->act({"windowfocus", "--sync", window, "mousemove", "--window", window, "5", "5"});
    return window;
  }
  void awaitAnswer() {
    EXPECT_TRUE(runUntil([this] { return !told.empty(); }));
  }
  /// For people to look at; it has to show something.
  void photograph(const std::string& name) const {
    const std::string path = std::string(ZAL_SCREENSHOTS) + "/" + name;
    std::filesystem::remove(path);
    display->photograph(path);
    EXPECT_GT(coloursOf(path), 20) << path;
  }

  TemporaryDirectory directory;
  const std::string alerts = alertDirectory(directory.path());
  std::optional<VirtualDisplay> display;
  std::optional<ChildProgram> dunst;
  BusConnection connection{host, host.sessionBus, "session bus"};
  // Its place would be taken by a dialog where the host is slow, as it is to be for people.
  NotificationScreen notifications{
      host, connection, {.call = std::chrono::minutes(1), .patience = std::chrono::minutes(1)}};
  DialogScreen dialogs{loop.context(), log, {.hasDisplay = true}};
  AlertScreens screens{{&notifications, &dialogs}};
  RuntimeAlertStore store{loop.context(), loop, clock, log, alerts};
  std::vector<std::string> told;
};

TEST_F(RealScreenTest, ANotificationIsSeenAndAPressOnItIsTheDefaultButton) {
  startNotificationServer();
  if (IsSkipped()) return;
  post(completion());
  const std::string window = awaitWindow("Dunst");
  photograph("alert.png");
  display->click(window, 2);
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("0"));
  EXPECT_TRUE(readAlert(alerts, "1")->answer->isFromScreen);
  awaitNoWindow("Dunst");
}

TEST_F(RealScreenTest, ANotificationThatThePersonClosesIsCancelled) {
  startNotificationServer();
  if (IsSkipped()) return;
  post(completion());
  display->click(awaitWindow("Dunst"), 1);
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("3"));
}

TEST_F(RealScreenTest, AnAnswerInTheDirectoryTakesTheNotificationFromTheScreen) {
  startNotificationServer();
  if (IsSkipped()) return;
  post(completion());
  awaitWindow("Dunst");
  EXPECT_EQ(answerAlert(alerts, "1", "default", std::nullopt), std::nullopt);
  awaitAnswer();
  awaitNoWindow("Dunst");
  EXPECT_THAT(told, ElementsAre("0"));
}

TEST_F(RealScreenTest, WhatIsTypedIntoThePromptIsTheAnswer) {
  post(problemPrompt());
  if (awaitPrompt().empty()) GTEST_SKIP() << "zenity is not installed";
  display->act({"type", "--delay", "5", "kein Ton \xC3\xA4\xC3\xB6 <b> --x"});
  runFor(std::chrono::milliseconds(100));  // the last letter is drawn; the picture alone depends on it
  photograph("prompt.png");
  display->act({"key", "Return"});
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("0 kein Ton \xC3\xA4\xC3\xB6 <b> --x"));
  const auto record = readAlert(alerts, "1");
  ASSERT_TRUE(record && record->answer);
  EXPECT_EQ(record->answer->text, "kein Ton \xC3\xA4\xC3\xB6 <b> --x");
  EXPECT_TRUE(record->answer->isFromScreen);
}

TEST_F(RealScreenTest, EscapeCancelsThePrompt) {
  post(problemPrompt());
  if (awaitPrompt().empty()) GTEST_SKIP() << "zenity is not installed";
  display->act({"key", "Escape"});
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("3 "));
}

TEST_F(RealScreenTest, AnAnswerInTheDirectoryTakesThePromptFromTheScreen) {
  post(problemPrompt());
  if (awaitPrompt().empty()) GTEST_SKIP() << "zenity is not installed";
  EXPECT_EQ(answerAlert(alerts, "1", "default", "by hand"), std::nullopt);
  awaitAnswer();
  awaitNoWindow("zenity");
  EXPECT_THAT(told, ElementsAre("0 by hand"));
}

TEST_F(RealScreenTest, WithoutANotificationServerANoticeIsADialog) {
  UserAlert alert = completion();
  alert.alternateButton = "Not now";
  alert.otherButton = "Later";
  post(alert);
  if (awaitPrompt().empty()) GTEST_SKIP() << "zenity is not installed";
  photograph("dialog.png");
  display->act({"key", "Return"});
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("0"));
}

/// Where zenity is not installed.
class RealSecondDialogTest : public RealScreenTest {
 protected:
  void SetUp() override {
    RealScreenTest::SetUp();
    if (IsSkipped()) return;
    if (!std::filesystem::exists("/usr/bin/kdialog")) GTEST_SKIP() << "kdialog is not installed";
    ::setenv("XDG_RUNTIME_DIR", directory.path().c_str(), 1);
  }
  void TearDown() override { ::unsetenv("XDG_RUNTIME_DIR"); }
  void postAndAwaitDialog(UserAlert alert) {
    secondStore.showOn(secondDialogs);
    secondStore.post(std::move(alert), [this](const AlertResponse& response) {
      const auto* const text = response.textFieldValue.as<std::string>();
      told.push_back(std::to_string(response.code) + (text != nullptr ? " " + *text : ""));
    });
    const std::string window = awaitWindow("kdialog");
    display->act({"windowfocus", "--sync", window, "mousemove", "--window", window, "5", "5"});
  }

  DialogScreen secondDialogs{loop.context(), log, {.hasDisplay = true, .zenity = "no-zenity-here"}};
  RuntimeAlertStore secondStore{loop.context(), loop, clock, log, alerts};
};

TEST_F(RealSecondDialogTest, WhatIsTypedIntoThePromptIsTheAnswer) {
  UserAlert prompt = problemPrompt();
  prompt.message = "-v \\n <b> & brief";
  postAndAwaitDialog(prompt);
  display->act({"type", "--delay", "5", "kein Ton \xC3\xA4 <b> --x"});
  runFor(std::chrono::milliseconds(100));  // as above
  photograph("second-prompt.png");
  display->act({"key", "Return"});
  awaitAnswer();
  EXPECT_THAT(told, ElementsAre("0 kein Ton \xC3\xA4 <b> --x"));
}

TEST_F(RealSecondDialogTest, AQuestionsSecondButtonAndEscapeAreTwoAnswers) {
  UserAlert alert = completion();
  alert.alternateButton = "Not & now";
  postAndAwaitDialog(alert);
  photograph("second-dialog.png");
  display->act({"key", "Tab", "key", "Return"});
  EXPECT_TRUE(runUntil([this] { return told.size() == 1; }));
  awaitNoWindow("kdialog");
  postAndAwaitDialog(alert);
  display->act({"key", "Escape"});
  EXPECT_TRUE(runUntil([this] { return told.size() == 2; }));
  EXPECT_THAT(told, ElementsAre("1", "3"));
}

TEST_F(RealScreenTest, WithoutAReachableDisplayTheAlertWaitsInTheDirectory) {
  if (!std::filesystem::exists("/usr/bin/zenity")) GTEST_SKIP() << "zenity is not installed";
  display.reset();
  ::setenv("DISPLAY", ":no-such-display", 1);
  post(problemPrompt());
  EXPECT_TRUE(runUntil([this] { return log.lines.size() == 2; }));
  ::unsetenv("DISPLAY");
  EXPECT_THAT(log.lines[1], ::testing::StartsWith("warning: No dialog can be shown: "));
  EXPECT_EQ(readAlert(alerts, "1")->state, AlertState::waiting);
  EXPECT_THAT(told, IsEmpty());
}

}  // namespace
}  // namespace zal::testing
