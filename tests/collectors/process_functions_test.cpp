#include "collectors/process_functions.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

class ProcessFunctionsTest : public ::testing::Test {
 protected:
  ProcessFunctionsTest() {
    table.table = std::vector<ProcessEntry>{
        {0, "kernel"}, {31, "horvand"}, {77, "sixteen-letters!"}, {78, "horvand"}, {90, "horvand-two"}};
  }
  testing::FakeProcessTable table;
  testing::RecordingCrashReporter crashes;
};

TEST_F(ProcessFunctionsTest, EmptyNameReturnsMinusOneWithoutReadingTheProcessTable) {
  EXPECT_EQ(ProcessIdForName(table, ""), -1);
  EXPECT_EQ(table.reads, 0);
}

TEST_F(ProcessFunctionsTest, FirstMatchWins) { EXPECT_EQ(ProcessIdForName(table, "horvand"), 31); }

TEST_F(ProcessFunctionsTest, NoMatchIsMinusOne) {
  EXPECT_EQ(ProcessIdForName(table, "horva"), -1);
  EXPECT_EQ(ProcessIdForName(table, "Horvand"), -1);
}

TEST_F(ProcessFunctionsTest, ProcessIdsBelowOneDoNotCount) {
  EXPECT_EQ(ProcessIdForName(table, "kernel"), -1);
}

TEST_F(ProcessFunctionsTest, LongerNameMatchesTheProcessNamedByItsFirstSixteenCharacters) {
  EXPECT_EQ(ProcessIdForName(table, "sixteen-letters!"), 77);
  EXPECT_EQ(ProcessIdForName(table, "sixteen-letters!-and-more"), 77);
  EXPECT_EQ(ProcessIdForName(table, "sixteen-letters"), -1);
}

TEST_F(ProcessFunctionsTest, UnreadableTableIsMinusOne) {
  table.table.reset();
  EXPECT_EQ(ProcessIdForName(table, "horvand"), -1);
}

TEST_F(ProcessFunctionsTest, SimulatedCrashNamesTheProcessAndTheReason) {
  SimulateCrashForProcess(table, crashes, "horvand", "the call froze");
  ASSERT_EQ(crashes.crashes.size(), 1U);
  EXPECT_EQ(crashes.crashes[0].process, 31);
  EXPECT_EQ(crashes.crashes[0].code, 0xFED9E2FFU);
  EXPECT_EQ(crashes.crashes[0].message,
            "Simulating crash for horvand from Quarro Debug because [the call froze].");
}

TEST_F(ProcessFunctionsTest, SimulatedCrashWithoutAReasonSaysSo) {
  SimulateCrashForProcess(table, crashes, "horvand", std::nullopt);
  ASSERT_EQ(crashes.crashes.size(), 1U);
  EXPECT_EQ(crashes.crashes[0].message,
            "Simulating crash for horvand from Quarro Debug because [No Reason Given].");
}

TEST_F(ProcessFunctionsTest, SimulatedCrashOfAnUnknownProcessDoesNothing) {
  SimulateCrashForProcess(table, crashes, "nobody", "x");
  EXPECT_TRUE(crashes.crashes.empty());
}

}  // namespace
}  // namespace zal
