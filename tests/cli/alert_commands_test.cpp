#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

class AlertCommandsTest : public ToolFixture {
 protected:
  AlertCommandsTest() {
    machine.postedAlerts = {
        {.id = "3",
         .title = "Vistel Logging",
         .message = "Please describe the problem briefly",
         .buttons = {{"default", "OK"}, {"alternate", "Cancel"}},
         .takesText = true,
         .posted = "2024-05-02 14:03:07",
         .state = "waiting",
         .answer = ""},
        {.id = "4",
         .title = "Auto\x1b[2Jmation",
         .message = "Started",
         .buttons = {{"default", "OK"}},
         .takesText = false,
         .posted = "2024-05-02 14:03:09",
         .state = "answered",
         .answer = "default"},
    };
  }
};

TEST_F(AlertCommandsTest, ThoseThatWaitAreListed) {
  EXPECT_EQ(run({"alerts"}), 0);
  EXPECT_EQ(out,
            "3  Vistel Logging  (waiting, 2024-05-02 14:03:07)\n"
            "    Please describe the problem briefly\n"
            "    default: OK   alternate: Cancel   cancel   (takes --text)\n");
}

TEST_F(AlertCommandsTest, AllAreListedWhenAskedFor) {
  EXPECT_EQ(run({"alerts", "--all"}), 0);
  EXPECT_EQ(out,
            "3  Vistel Logging  (waiting, 2024-05-02 14:03:07)\n"
            "    Please describe the problem briefly\n"
            "    default: OK   alternate: Cancel   cancel   (takes --text)\n"
            "4  Auto\\x1b[2Jmation  (answered: default, 2024-05-02 14:03:09)\n"
            "    Started\n"
            "    default: OK   cancel\n");
}

TEST_F(AlertCommandsTest, NoneIsSaidInWords) {
  machine.postedAlerts.erase(machine.postedAlerts.begin());
  EXPECT_EQ(run({"alerts"}), 0);
  EXPECT_EQ(out, "No alert waits.\n");
  machine.postedAlerts.clear();
  EXPECT_EQ(run({"alerts", "--all"}), 0);
  EXPECT_EQ(out, "There are no alerts.\n");
  EXPECT_EQ(run({"alerts", "--json"}), 0);
  EXPECT_EQ(out, "[]\n");
}

TEST_F(AlertCommandsTest, ForProgramsItIsAnArray) {
  EXPECT_EQ(run({"alerts", "--json"}), 0);
  EXPECT_EQ(
      out,
      R"([{"id": "3", "state": "waiting", "posted": "2024-05-02 14:03:07", "title": "Vistel Logging", )"
      R"("message": "Please describe the problem briefly", "buttons": {"default": "OK", "alternate": "Cancel"}, )"
      R"("takesText": true, "answer": ""}])"
      "\n");
}

TEST_F(AlertCommandsTest, AnswerGoesToTheAlert) {
  EXPECT_EQ(run({"alerts", "answer", "3", "--text", "no sound"}), 0) << err;
  EXPECT_EQ(run({"alerts", "answer", "3", "--button", "cancel"}), 0) << err;
  EXPECT_EQ(run({"alerts", "answer", "3", "--button", "alternate", "--text", "", "--json"}), 0) << err;
  EXPECT_EQ(out, "{\"result\": \"done\"}\n");
  EXPECT_EQ(machine.answers,
            (std::vector<std::string>{"3 default \"no sound\"", "3 cancel", "3 alternate \"\""}));
}

TEST_F(AlertCommandsTest, UnknownOrFinishedAlertIsNotFound) {
  EXPECT_EQ(run({"alerts", "answer", "7"}), 3);
  EXPECT_EQ(err, "lirractl: there is no alert 7\n  \"lirractl alerts\" shows those that wait.\n");
  EXPECT_EQ(run({"alerts", "answer", "4"}), 3);
  EXPECT_EQ(err,
            "lirractl: alert 4 takes no answer any more: answered\n"
            "  \"lirractl alerts\" shows those that wait.\n");
  EXPECT_TRUE(machine.answers.empty());
}

TEST_F(AlertCommandsTest, AnswerThatTheAlertDoesNotTakeIsWrongUsage) {
  EXPECT_EQ(run({"alerts", "answer", "3", "--button", "other"}), 2);
  EXPECT_EQ(run({"alerts", "answer", "3", "--button", "yes"}), 2);
  machine.postedAlerts[0].takesText = false;
  EXPECT_EQ(run({"alerts", "answer", "3", "--text", "x"}), 2);
  EXPECT_EQ(run({"alerts", "answer"}), 2);
  EXPECT_TRUE(machine.answers.empty());
}

TEST_F(AlertCommandsTest, AnswerThatCannotBeStoredIsAnError) {
  machine.answerTrouble = "it cannot be written";
  EXPECT_EQ(run({"alerts", "answer", "3"}), 4);
  EXPECT_EQ(err, "lirractl: not answered: it cannot be written\n");
}

}  // namespace
}  // namespace zal::testing
