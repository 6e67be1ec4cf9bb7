#include "session/session_lines.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

constexpr const char* kWritten = "14:03:07.251  (2024-05-02) (CEST)";

TEST(SessionLinesTest, WritesBeginAndEndWithTwoBlanks) {
  EXPECT_EQ(beginLine("X", kWritten), "[Sender: X] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]");
  EXPECT_EQ(endLine("X", kWritten), "[Sender: X] End Session  [14:03:07.251  (2024-05-02) (CEST)]");
  EXPECT_EQ(beginLine("", kWritten), "[Sender: ] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]");
}

TEST(SessionLinesTest, WritesCheckpointsWhateverIsMissing) {
  EXPECT_EQ(checkpointLine("Connected", "X", "T"), "[Sender: X] Connected   [T]");
  EXPECT_EQ(checkpointLine("", "X", "T"), "[Sender: X] (No checkpoint provided)   [T]");
  EXPECT_EQ(checkpointLine("Connected", std::nullopt, "T"), "[Sender: (No sender)] Connected   [T]");
  EXPECT_EQ(checkpointLine(std::nullopt, "", "T"), "[Sender: (No sender)] (No checkpoint provided)   [T]");
}

TEST(SessionLinesTest, WritesDescriptionsWhateverIsMissing) {
  EXPECT_EQ(descriptionLine("What", "log", "X", "T"), "[Sender: X] What: log   [T]");
  EXPECT_EQ(descriptionLine("What", "", "X", "T"), "[Sender: X] What   [T]");
  EXPECT_EQ(descriptionLine(std::nullopt, "log", "X", "T"), "[Sender: X] log   [T]");
  EXPECT_EQ(descriptionLine("", std::nullopt, "X", "T"), "[Sender: X] ** No Log Provided **   [T]");
}

TEST(SessionLinesTest, WritesMetrics) {
  EXPECT_EQ(metricLine("rtt", "4.5", "X", "T"), "[Sender: X] rtt: 4.5   [T]");
}

TEST(SessionLinesTest, MakesHeaderLinesOnlyOfLabelAndValue) {
  EXPECT_EQ(headerLine("Recipient ID", "bob"), "[Recipient ID: bob]");
  EXPECT_EQ(headerLine("Recipient ID", ""), std::nullopt);
  EXPECT_EQ(headerLine("Recipient ID", std::nullopt), std::nullopt);
  EXPECT_EQ(headerLine("", "bob"), std::nullopt);
}

TEST(SessionLinesTest, MarksEchoes) { EXPECT_EQ(echoOf("[a: b]"), "=== [a: b]"); }

}  // namespace
}  // namespace zal
