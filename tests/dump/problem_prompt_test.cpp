#include "dump/problem_prompt.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(ProblemPromptTest, IsAnUrgentAlertWithOneEmptyLineThatWaitsForEver) {
  const UserAlert alert = ProblemPrompt("Vistel Logging", "Please describe", "Send", "Cancel");
  EXPECT_EQ(alert.identifier, "__ksLirraUserInputNotificationForTitleAndMessageIdentifier");
  EXPECT_EQ(alert.title, "Vistel Logging");
  EXPECT_EQ(alert.message, "Please describe");
  EXPECT_EQ(alert.defaultButton, "Send");
  EXPECT_EQ(alert.alternateButton, "Cancel");
  EXPECT_EQ(alert.otherButton, std::nullopt);
  EXPECT_EQ(alert.timeout, 0);
  EXPECT_EQ(alert.level, 3);
  EXPECT_EQ(alert.displayFlags, 0U);
  ASSERT_TRUE(alert.textField);
  EXPECT_EQ(alert.textField->title, "");
  EXPECT_EQ(alert.textField->initialValue, "");
  EXPECT_TRUE(alert.information.empty());
}

TEST(ProblemPromptTest, TextsThatAreNotGivenHaveDefaults) {
  const UserAlert alert = ProblemPrompt(std::nullopt, std::nullopt, std::nullopt, std::nullopt);
  EXPECT_EQ(alert.title, "Title");
  EXPECT_EQ(alert.message, "Message");
  EXPECT_EQ(alert.defaultButton, "OK");
  EXPECT_EQ(alert.alternateButton, std::nullopt);
}

TEST(ProblemPromptTest, AnEmptyTitleIsATitle) { EXPECT_EQ(ProblemPrompt("", "m", "OK", "Cancel").title, ""); }

TEST(ProblemPromptTest, OnlyATextThatIsNotEmptyWasTyped) {
  EXPECT_EQ(typedText({0, "no sound"}), "no sound");
  EXPECT_EQ(typedText({0, " "}), " ");
  EXPECT_EQ(typedText({0, ""}), std::nullopt);
  EXPECT_EQ(typedText({0, nullptr}), std::nullopt);
  EXPECT_EQ(typedText({0, std::int64_t{5}}), std::nullopt);
  EXPECT_EQ(typedText({0, ValueList{"no sound"}}), std::nullopt);
}

}  // namespace
}  // namespace zal
