#include "platform/linux/dialog/dialog_command.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/linux/alerts/problem_prompt.h"

namespace zal {
namespace {

using testing::problemPrompt;

using ::testing::ElementsAre;

using Words = std::vector<std::string>;

UserAlert question() {
  UserAlert alert = problemPrompt();
  alert.textField.reset();
  alert.otherButton = "Later_on";
  return alert;
}

UserAlert notice() {
  UserAlert alert = question();
  alert.alternateButton.reset();
  alert.otherButton.reset();
  return alert;
}

Words zenityWords(const UserAlert& alert) { return *dialogArguments(DialogProgram::zenity, alert); }

/// "button N", "button N: TEXT", or "not seen: REASON".
std::string read(const UserAlert& alert, const DialogOutcome& outcome,
                 DialogProgram program = DialogProgram::zenity) {
  std::string reason;
  const auto answer = dialogAnswer(program, alert, outcome, reason);
  if (!answer) return "not seen: " + reason;
  return "button " + std::to_string(answer->code) + (answer->text ? ": " + *answer->text : "");
}

TEST(DialogArgumentsTest, APromptIsAnEntryWithItsTwoButtons) {
  EXPECT_THAT(zenityWords(problemPrompt()),
              ElementsAre("--entry", "--title=Vistel Logging", "--text=Please describe the problem briefly",
                          "--entry-text=", "--ok-label=OK", "--cancel-label=Cancel", "--width=360"));
}

TEST(DialogArgumentsTest, AnAlertWithoutATextFieldIsAQuestionOrANotice) {
  EXPECT_THAT(zenityWords(question()),
              ElementsAre("--question", "--title=Vistel Logging", "--no-markup",
                          "--text=Please describe the problem briefly", "--ok-label=OK",
                          "--cancel-label=Cancel", "--extra-button=Later__on"));
  EXPECT_THAT(zenityWords(notice()),
              ElementsAre("--info", "--title=Vistel Logging", "--no-markup",
                          "--text=Please describe the problem briefly", "--ok-label=OK"));
}

TEST(DialogArgumentsTest, HostileTextsAreNoOptionsNoMarkupAndNoEscapes) {
  UserAlert alert = problemPrompt();
  alert.title = "--help\n<b>T</b>";
  alert.message = "-v \\n <b>&amp;</b> _x";
  alert.textField = UserAlert::TextField{"--name", "--initial \\t _y"};
  EXPECT_THAT(
      zenityWords(alert),
      ElementsAre("--entry", "--title=--help <b>T</b>", "--text=-v \\\\n <b>&amp;</b> __x\n--name",
                  "--entry-text=--initial \\t _y", "--ok-label=OK", "--cancel-label=Cancel", "--width=360"));
  EXPECT_THAT(*dialogArguments(DialogProgram::kdialog, alert),
              ElementsAre("--title=--help <b>T</b>",
                          "--inputbox=<qt>-v \\\\n &lt;b>&amp;&amp;amp;&lt;/b> _x<br>--name</qt>", "--",
                          "--initial \\t _y"));
}

TEST(DialogArgumentsTest, AnEndlessMessageStillFitsOnAScreen) {
  UserAlert alert = problemPrompt();
  alert.title = std::string(4096, 't');
  alert.message = std::string(4096, 'x');
  const Words words = zenityWords(alert);
  EXPECT_EQ(words[1].size(), std::string("--title=").size() + 80 + 3);
  const std::string text = words[2].substr(std::string("--text=").size());
  EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 11);
  EXPECT_EQ(text.substr(0, 45), std::string(44, 'x') + "\n");
}

TEST(DialogArgumentsTest, TheSecondProgramHasTheSameDialogsUpToTwoButtons) {
  EXPECT_THAT(*dialogArguments(DialogProgram::kdialog, problemPrompt()),
              ElementsAre("--title=Vistel Logging", "--inputbox=<qt>Please describe the problem briefly</qt>",
                          "--", ""));
  UserAlert two = question();
  two.otherButton.reset();
  EXPECT_THAT(*dialogArguments(DialogProgram::kdialog, two),
              ElementsAre("--title=Vistel Logging", "--yes-label=OK", "--no-label=Cancel",
                          "--yesno=<qt>Please describe the problem briefly</qt>"));
  EXPECT_THAT(*dialogArguments(DialogProgram::kdialog, notice()),
              ElementsAre("--title=Vistel Logging", "--msgbox=<qt>Please describe the problem briefly</qt>"));
  EXPECT_EQ(dialogArguments(DialogProgram::kdialog, question()), std::nullopt);
}

TEST(DialogArgumentsTest, AnAmpersandIsNoShortcutInTheSecondProgram) {
  UserAlert two = question();
  two.otherButton.reset();
  two.message = "a & b";
  two.defaultButton = "Fish & Chips";
  EXPECT_THAT(*dialogArguments(DialogProgram::kdialog, two),
              ElementsAre("--title=Vistel Logging", "--yes-label=Fish && Chips", "--no-label=Cancel",
                          "--yesno=<qt>a &amp; b</qt>"));
}

TEST(DialogEnvironmentTest, OursGoesBeforeWhatTheAgentHas) {
  EXPECT_THAT(dialogEnvironment({"DISPLAY=:9", "LC_ALL=C", "ZENITY_OK=1", "LC_ALLSORTS=1"}),
              ElementsAre("DISPLAY=:9", "LC_ALLSORTS=1", "GTK_USE_PORTAL=0", "NO_AT_BRIDGE=1",
                          "LC_ALL=C.UTF-8", "ZENITY_OK=20", "ZENITY_CANCEL=21", "ZENITY_ESC=22"));
}

TEST(DialogAnswerTest, TheDefaultButtonBringsTheTextWithoutItsLineEnd) {
  EXPECT_EQ(read(problemPrompt(), {20, "no sound\n", ""}), "button 0: no sound");
  EXPECT_EQ(read(problemPrompt(), {20, "\n", "some warning"}), "button 0: ");
  EXPECT_EQ(read(problemPrompt(), {0, "two\nlines\n", ""}), "button 0: two\nlines");
  EXPECT_EQ(read(notice(), {20, "", ""}), "button 0");
}

TEST(DialogAnswerTest, CancelIsTheAlternateButtonAndEscapeIsNone) {
  EXPECT_EQ(read(problemPrompt(), {21, "", ""}), "button 1");
  EXPECT_EQ(read(problemPrompt(), {22, "typed\n", ""}), "button 3");
  EXPECT_EQ(read(notice(), {21, "", ""}), "button 3");
}

TEST(DialogAnswerTest, AFurtherButtonIsKnownByItsLabel) {
  EXPECT_EQ(read(question(), {22, "Later__on\n", ""}), "button 2");
  EXPECT_EQ(read(question(), {1, "Later__on\n", ""}), "button 2");
  EXPECT_EQ(read(question(), {22, "", ""}), "button 3");
}

TEST(DialogAnswerTest, AProgramThatWasToldNothingCancelsWithOne) {
  EXPECT_EQ(read(problemPrompt(), {1, "", "Gtk-Message: harmless\n"}), "button 3");
}

TEST(DialogAnswerTest, TheSecondProgramTellsItsSecondButtonFromAClosedWindowButBesideAText) {
  constexpr auto kKdialog = DialogProgram::kdialog;
  UserAlert two = question();
  two.otherButton.reset();
  EXPECT_EQ(read(two, {0, "", ""}, kKdialog), "button 0");
  EXPECT_EQ(read(two, {1, "", ""}, kKdialog), "button 1");
  EXPECT_EQ(read(two, {2, "", ""}, kKdialog), "button 3");
  EXPECT_EQ(read(notice(), {2, "", ""}, kKdialog), "button 3");
  EXPECT_EQ(read(problemPrompt(), {0, "no sound\n", ""}, kKdialog), "button 0: no sound");
  EXPECT_EQ(read(problemPrompt(), {1, "", ""}, kKdialog), "button 3");
  EXPECT_EQ(read(problemPrompt(), {-6, "", "could not connect to display :9\n"}, kKdialog),
            "not seen: could not connect to display :9");
  EXPECT_EQ(read(two, {1, "", "qt.qpa.xcb: could not connect to display :9\n"}, kKdialog),
            "not seen: qt.qpa.xcb: could not connect to display :9");
}

TEST(DialogAnswerTest, NoDisplayIsNoAnswer) {
  EXPECT_EQ(read(problemPrompt(), {1, "", "\n(zenity:1): Gtk-WARNING **: cannot open display: :9\n"}),
            "not seen: (zenity:1): Gtk-WARNING **: cannot open display: :9");
  EXPECT_EQ(read(problemPrompt(), {1, "", "Could not connect to DISPLAY"}),
            "not seen: Could not connect to DISPLAY");
}

TEST(DialogAnswerTest, AnyOtherEndIsNoAnswerAndHasItsReason) {
  EXPECT_EQ(read(problemPrompt(), {255, "text", "no such option\n\x1b[1m"}), "not seen: \\x1b[1m");
  EXPECT_EQ(read(problemPrompt(), {5, "", ""}), "not seen: it ended with status 5");
  EXPECT_EQ(read(problemPrompt(), {-9, "text", ""}), "not seen: it was ended by signal 9");
}

}  // namespace
}  // namespace zal
