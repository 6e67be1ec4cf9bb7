#include "cli/progress_lines.h"

#include <sstream>

#include <gtest/gtest.h>

#include "cli/dump_display.h"
#include "cli/dump_run.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

DumpView threeSteps(std::size_t begun) {
  DumpView dump;
  dump.steps = {{"Network state", {}}, {"Crash logs", {}}, {"Archive", {}}};
  dump.currentStep = begun;
  for (std::size_t i = 0; i < begun; ++i) dump.steps[i].began = 65s * i;
  return dump;
}

TEST(ProgressLinesTest, ElapsedTimesLineUp) {
  EXPECT_EQ(elapsedText(0ms), "    0:00");
  EXPECT_EQ(elapsedText(999ms), "    0:00");
  EXPECT_EQ(elapsedText(65'000ms), "    1:05");
  EXPECT_EQ(elapsedText(3'599'999ms), "   59:59");
  EXPECT_EQ(elapsedText(3'600'000ms), " 1:00:00");
}

TEST(ProgressLinesTest, StepsAndGapsAreNamed) {
  EXPECT_EQ(stepLine(threeSteps(1), 2, 5s), "    0:05  step 2 of 3: Crash logs");
  EXPECT_EQ(missingLine({"stackshot", "no service"}), "          missing: stackshot: no service");
}

TEST(ProgressLinesTest, NamesCannotSteerATerminal) {
  DumpView dump;
  dump.steps = {{"a\x1b[2J\nb", {}}};
  EXPECT_EQ(stepLine(dump, 1, 0s), "    0:00  step 1 of 1: a\\x1b[2J\\nb");
  EXPECT_EQ(missingLine({"w\x1b", "y\r"}), "          missing: w\\x1b: y\\r");
}

TEST(ProgressLinesTest, LinesAreCutBetweenCharacters) {
  EXPECT_EQ(fitting("abc", 3), "abc");
  EXPECT_EQ(fitting("abc", 2), "ab");
  EXPECT_EQ(fitting("a\u00e9\u00e9", 2), "a\u00e9");
  EXPECT_EQ(fitting("abc", 0), "");
}

TEST(ProgressLinesTest, OnlyDumpsOfTheTypeCount) {
  DumpView dump;
  dump.service = "Vistel";
  dump.directory = "/reports/Vistel/Vistel-Log (2024-05-02 at 14-03-07 (CEST)) (no sound)";
  EXPECT_TRUE(isDumpOf(dump, "Vistel"));
  EXPECT_FALSE(isDumpOf(dump, "Vist"));
  dump.directory = "/reports/Vistel/2024-05-02 at 14-03-07 (CEST) (Initiator)";
  EXPECT_FALSE(isDumpOf(dump, "Vistel")) << "the collection at a session's end";
}

class DumpDisplayTest : public ::testing::Test {
 protected:
  std::string shown() {
    std::string text = out.str();
    out.str("");
    return text;
  }
  std::ostringstream out;
};

TEST_F(DumpDisplayTest, WithoutATerminalEachStepIsALineWhenItBegins) {
  DumpDisplay display(out, 0);
  display.waiting("the agent begins", 0s);
  EXPECT_EQ(shown(), "");
  display.update(threeSteps(0), 0s);
  EXPECT_EQ(shown(), "");
  display.update(threeSteps(1), 1s);
  EXPECT_EQ(shown(), "    0:00  step 1 of 3: Network state\n");
  display.update(threeSteps(1), 2s);
  EXPECT_EQ(shown(), "");
  DumpView last = threeSteps(3);
  last.missing = {{"stackshot", "no service"}};
  last.state = DumpView::State::done;
  display.update(last, 131s);
  EXPECT_EQ(shown(),
            "    1:05  step 2 of 3: Crash logs\n"
            "    2:10  step 3 of 3: Archive\n"
            "          missing: stackshot: no service\n");
  display.close();
  EXPECT_EQ(shown(), "");
}

TEST_F(DumpDisplayTest, OnATerminalTheLineOfTheRunningStepIsRedrawn) {
  DumpDisplay display(out, 80);
  display.waiting("the agent begins", 0s);
  EXPECT_EQ(shown(), "\r\x1b[K    0:00  the agent begins");
  display.update(threeSteps(1), 1s);
  EXPECT_EQ(shown(), "\r\x1b[K    0:01  step 1 of 3: Network state");
  display.update(threeSteps(1), 1999ms);
  EXPECT_EQ(shown(), "") << "nothing changed that one could see";
  DumpView second = threeSteps(2);
  second.missing = {{"stackshot", "no service"}};
  display.update(second, 66s);
  EXPECT_EQ(shown(),
            "\r\x1b[K    0:00  step 1 of 3: Network state\n"
            "          missing: stackshot: no service\n"
            "\r\x1b[K    1:06  step 2 of 3: Crash logs");
  display.close();
  EXPECT_EQ(shown(), "\r\x1b[K    1:05  step 2 of 3: Crash logs\n");
}

TEST_F(DumpDisplayTest, RedrawnLineStaysOneLineInANarrowTerminal) {
  DumpDisplay display(out, 20);
  display.update(threeSteps(1), 1s);
  EXPECT_EQ(shown(), "\r\x1b[K    0:01  step 1 of");
}

TEST_F(DumpDisplayTest, StepThatWasPassedOverIsNoLine) {
  DumpView dump = threeSteps(3);
  dump.steps[1].began.reset();
  DumpDisplay display(out, 0);
  display.update(dump, 200s);
  EXPECT_EQ(shown(), "    0:00  step 1 of 3: Network state\n    2:10  step 3 of 3: Archive\n");
}

TEST_F(DumpDisplayTest, RecordThatCountsBeyondItsStepsIsNoTrouble) {
  DumpView dump = threeSteps(3);
  dump.currentStep = 9;
  dump.steps.resize(1);
  DumpDisplay display(out, 0);
  display.update(dump, 1s);
  EXPECT_EQ(shown(), "    0:00  step 1 of 1: Network state\n");
}

}  // namespace
}  // namespace zal::testing
