#include "platform/linux/helper/bounded_program.h"

#include <gtest/gtest.h>

namespace zal::helper {
namespace {

using namespace std::chrono_literals;

class BoundedProgramTest : public ::testing::Test {
 protected:
  ProgramOutcome shell(const std::string& line, const ProgramLimits& limits = {}) {
    return runBounded({"/bin/sh", "-c", line}, patience, limits);
  }
  Patience patience{60s};
};

TEST_F(BoundedProgramTest, SaysWhatTheProgramSaidOnEachOfItsOutputs) {
  const auto outcome = shell("echo out; echo err >&2");
  EXPECT_EQ(outcome.output, "out\n");
  EXPECT_EQ(outcome.errors, "err\n");
  EXPECT_EQ(outcome.trouble, "");
}

TEST_F(BoundedProgramTest, StatusAndSignalAreTrouble) {
  EXPECT_EQ(shell("echo some; exit 7").trouble, "ended with status 7");
  EXPECT_EQ(shell("kill -9 $$").trouble, "ended by signal 9");
  EXPECT_EQ(runBounded({"no-such-program-anywhere"}, patience).trouble, "not installed");
}

TEST_F(BoundedProgramTest, OneThatHangsIsCutOffAndWhatItSaidIsKept) {
  const auto outcome = shell("echo some; exec sleep 1000", {.time = 300ms});
  EXPECT_EQ(outcome.output, "some\n");
  EXPECT_EQ(outcome.trouble, "cut off after 300 ms");
}

TEST_F(BoundedProgramTest, MoreThanItMaySayIsDroppedAndItStillEnds) {
  const auto outcome =
      shell("i=0; while [ $i -lt 20000 ]; do echo 0123456789; i=$((i+1)); done", {.bytes = 25});
  EXPECT_EQ(outcome.output, "0123456789\n0123456789\n012");
  EXPECT_EQ(outcome.trouble, "");
}

TEST_F(BoundedProgramTest, ChildThatKeepsTheOutputOpenIsNotWaitedFor) {
  const auto outcome = shell("echo some; sleep 1000 & echo $!; exit 0");
  EXPECT_TRUE(outcome.output.starts_with("some\n"));
  EXPECT_EQ(outcome.trouble, "");
  EXPECT_EQ(shell("kill " + outcome.output.substr(5)).trouble, "");
}

TEST_F(BoundedProgramTest, NothingRunsWhenThePatienceIsOver) {
  Patience none(0s);
  EXPECT_EQ(runBounded({"/bin/true"}, none).trouble, "not run: its time of 0 ms was up");
}

TEST_F(BoundedProgramTest, EndOfThePatienceCutsOff) {
  Patience little(200ms);
  EXPECT_EQ(runBounded({"/bin/sleep", "1000"}, little, {.time = 50s}).trouble,
            "cut off: its time of 200 ms was up");
}

}  // namespace
}  // namespace zal::helper
