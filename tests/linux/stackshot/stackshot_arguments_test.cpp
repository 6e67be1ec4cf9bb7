#include "platform/linux/stackshot/arguments.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using stackshot::Arguments;
using stackshot::parseArguments;

std::string trouble(const std::vector<std::string>& words) {
  const auto parsed = parseArguments(words);
  const auto* text = std::get_if<std::string>(&parsed);
  return text == nullptr ? "" : *text;
}

TEST(StackshotArgumentsTest, TheMachineWithReasonCodeAndLimit) {
  const auto parsed = std::get<Arguments>(
      parseArguments({"--reason", "why", "--code", "0xf33d1337", "--output", "/d", "--limit", "9"}));
  EXPECT_FALSE(parsed.process);
  EXPECT_EQ(parsed.reason, "why");
  EXPECT_EQ(parsed.code, 0xF33D1337U);
  EXPECT_EQ(parsed.output, "/d");
  EXPECT_EQ(parsed.limit, std::chrono::seconds(9));
}

TEST(StackshotArgumentsTest, OneProcessWithAMessageOrAnException) {
  const auto crash = std::get<Arguments>(
      parseArguments({"--pid", "12", "--code", "4275692287", "--message", "m", "--output", "-"}));
  EXPECT_EQ(crash.process, 12);
  EXPECT_EQ(crash.code, 0xFED9E2FFU);
  EXPECT_EQ(crash.message, "m");
  EXPECT_EQ(crash.limit, std::chrono::seconds(6));
  EXPECT_EQ(
      std::get<Arguments>(parseArguments({"--pid", "1", "--exception", "e", "--output", "x"})).exception,
      "e");
}

TEST(StackshotArgumentsTest, WhatIsWrongIsSaid) {
  EXPECT_EQ(trouble({}), "--output is missing");
  EXPECT_EQ(trouble({"--output"}), "--output needs a value");
  EXPECT_EQ(trouble({"--output", ""}), "\"\" is nothing for --output");
  EXPECT_EQ(trouble({"-x", "1"}), "\"-x\" is not understood");
  for (const char* id : {"0", "-1", "1x", "", "99999999999"}) {
    EXPECT_EQ(trouble({"--pid", id}), "\"" + std::string(id) + "\" is nothing for --pid");
  }
  EXPECT_EQ(trouble({"--code", "0x1FFFFFFFF"}), "\"0x1FFFFFFFF\" is nothing for --code");
  EXPECT_EQ(trouble({"--limit", "0"}), "\"0\" is nothing for --limit");
  EXPECT_EQ(trouble({"--message", "m", "--output", "x"}), "--message and --exception need --pid");
  EXPECT_EQ(trouble({"--pid", "1", "--reason", "m", "--output", "x"}),
            "--reason is for the machine, without --pid");
}

TEST(StackshotArgumentsTest, HelpNeedsNothingElse) {
  EXPECT_TRUE(std::get<Arguments>(parseArguments({"--help"})).help);
}

}  // namespace
}  // namespace zal::testing
