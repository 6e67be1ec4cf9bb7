#include "platform/linux/dialog/dialog_screen.h"

#include <signal.h>
#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/loop/linux_run_loop.h"
#include "tests/linux/alerts/problem_prompt.h"
#include "tests/linux/loop/run_until.h"
#include "tests/support/child_program.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using testing::problemPrompt;

using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// Real child processes; what a dialog's program does is a script of the test's.
class DialogScreenTest : public ::testing::Test {
 protected:
  /// What the program does; $D is the test's directory.
  void install(const std::string& name, const std::string& script) const {
    testing::writeFile(directory / name, "#!/bin/sh\nD='" + directory.path() + "'\n" + script + "\n");
    ::chmod((directory / name).c_str(), 0755);
  }
  void present(const std::string& id, const UserAlert& alert = problemPrompt()) {
    screen->present(id, alert,
                    {.onAnswer =
                         [this, id](const AlertAnswer& answer) {
                           told.push_back(id + " button " + std::to_string(answer.code) + ": " +
                                          answer.text.value_or("-"));
                         },
                     .onDeclined = [this, id] { told.push_back(id + " declined"); }});
  }
  void runUntil(const std::function<bool()>& condition) { testing::runUntil(loop, condition); }
  void runUntilTold(std::size_t count) {
    runUntil([&] { return told.size() == count; });
  }
  /// The processes that wait in the directory for their end.
  std::vector<pid_t> openDialogs() const {
    std::vector<pid_t> open;
    for (const auto& entry : std::filesystem::directory_iterator(directory.path())) {
      const std::string name = entry.path().filename().string();
      if (!name.starts_with("pid-")) continue;
      const pid_t process = std::stoi(name.substr(4));
      if (::kill(process, 0) == 0) open.push_back(process);
    }
    return open;
  }
  std::unique_ptr<DialogScreen> makeScreen(bool hasDisplay = true) {
    return std::make_unique<DialogScreen>(
        loop.context(), log,
        DialogScreen::Options{
            .hasDisplay = hasDisplay, .zenity = directory / "zenity", .kdialog = directory / "kdialog"});
  }
  /// A dialog that stays until somebody ends it.
  void installOpenDialog() const { install("zenity", ": > $D/pid-$$; exec sleep 1000"); }

  testing::TemporaryDirectory directory;
  testing::RecordingAgentLog log;
  LinuxRunLoop loop;
  std::unique_ptr<DialogScreen> screen = makeScreen();
  std::vector<std::string> told;
};

TEST_F(DialogScreenTest, WithoutADisplayNothingIsStartedAndNothingIsSaid) {
  installOpenDialog();
  screen = makeScreen(false);
  present("1");
  EXPECT_THAT(told, ElementsAre("1 declined"));
  EXPECT_THAT(log.lines, IsEmpty());
  EXPECT_THAT(openDialogs(), IsEmpty());
}

TEST_F(DialogScreenTest, WhatIsTypedIsTheAnswerAndWordsArriveAsTheyAre) {
  install("zenity",
          "printf '<%s>' \"$@\" > $D/words; echo noise >&2; printf 'kein Ton \\303\\244\\n'; exit 20");
  UserAlert alert = problemPrompt();
  alert.title = "-x; touch $D/owned `touch $D/owned`";
  present("1", alert);
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("1 button 0: kein Ton \xC3\xA4"));
  EXPECT_EQ(testing::readFile(directory / "words"),
            "<--entry><--title=-x; touch $D/owned `touch $D/owned`><--text=Please describe the problem "
            "briefly><--entry-text=>"
            "<--ok-label=OK><--cancel-label=Cancel><--width=360>");
  EXPECT_FALSE(std::filesystem::exists(directory / "owned"));
}

TEST_F(DialogScreenTest, CancelIsAnAnswer) {
  install("zenity", "exit 21");
  present("1");
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("1 button 1: -"));
}

TEST_F(DialogScreenTest, TheSecondProgramIsForHostsWithoutTheFirst) {
  install("kdialog", "echo \"from $1\"");
  present("1");
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("1 button 0: from --title=Vistel Logging"));
}

TEST_F(DialogScreenTest, WithoutAnyProgramItIsSaidOnce) {
  present("1");
  present("2");
  EXPECT_THAT(told, ElementsAre("1 declined", "2 declined"));
  EXPECT_THAT(log.lines,
              ElementsAre("warning: No dialog can be shown: neither zenity nor kdialog can show it; "
                          "alerts wait in the runtime directory"));
}

TEST_F(DialogScreenTest, ADisplayThatCannotBeReachedIsSaidOnceUntilOneIsThere) {
  install("zenity", "echo 'cannot open display: :9' >&2; exit 1");
  present("1");
  runUntilTold(1);
  present("2");
  runUntilTold(2);
  EXPECT_THAT(told, ElementsAre("1 declined", "2 declined"));
  EXPECT_THAT(log.lines,
              ElementsAre("warning: No dialog can be shown: cannot open display: :9; alerts wait in "
                          "the runtime directory"));
  install("zenity", "exit 20");
  present("3");
  runUntilTold(3);
  install("zenity", "exit 7");
  present("4");
  runUntilTold(4);
  EXPECT_EQ(log.lines.size(), 2U);
}

TEST_F(DialogScreenTest, WithdrawnItDisappearsAndNobodyIsTold) {
  installOpenDialog();
  present("1");
  runUntil([&] { return openDialogs().size() == 1; });
  screen->withdraw("1");
  screen->withdraw("1");
  runUntil([&] { return openDialogs().empty(); });
  EXPECT_THAT(told, IsEmpty());
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(DialogScreenTest, ThreeAreOpenAtOnceAndOthersWaitForTheirTurn) {
  installOpenDialog();
  for (const char* const id : {"1", "2", "3", "4", "5"}) present(id);
  runUntil([&] { return openDialogs().size() == 3; });
  screen->withdraw("4");
  install("zenity", "echo five; exit 20");
  screen->withdraw("2");
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("5 button 0: five"));
  runUntil([&] { return openDialogs().size() == 2; });
}

TEST_F(DialogScreenTest, OneThatIsKilledByOthersIsNoAnswer) {
  installOpenDialog();
  present("1");
  runUntil([&] { return openDialogs().size() == 1; });
  ::kill(openDialogs().front(), SIGTERM);
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("1 declined"));
}

TEST_F(DialogScreenTest, AtTheEndOfTheAgentEveryWindowGoes) {
  installOpenDialog();
  for (const char* const id : {"1", "2"}) present(id);
  runUntil([&] { return openDialogs().size() == 2; });
  screen->agentEnds();
  runUntil([&] { return openDialogs().empty(); });
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(DialogScreenTest, EndlessOutputIsReadAndItsBeginningKept) {
  install("zenity", "head -c 1000000 /dev/zero | tr '\\0' x; head -c 300000 /dev/zero >&2; exit 20");
  present("1");
  runUntilTold(1);
  EXPECT_EQ(told.front(), "1 button 0: " + std::string(DialogProcess::kMostBytes, 'x'));
}

TEST_F(DialogScreenTest, AProgramsOwnChildrenAreNotWaitedFor) {
  install("zenity", "sleep 1000 & echo $! > $D/child; echo done; exit 20");
  present("1");
  runUntilTold(1);
  EXPECT_THAT(told, ElementsAre("1 button 0: done"));
  ::kill(std::stoi(testing::readFile(directory / "child")), SIGKILL);
}

TEST_F(DialogScreenTest, TheScreenMayGoWithItsWindowsOpen) {
  installOpenDialog();
  present("1");
  runUntil([&] { return openDialogs().size() == 1; });
  screen.reset();
  runUntil([&] { return openDialogs().empty(); });
}

}  // namespace
}  // namespace zal
