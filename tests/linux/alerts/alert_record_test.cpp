#include "platform/linux/alerts/alert_record.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::IsEmpty;

UserAlert question() {
  UserAlert alert;
  alert.identifier = "kind";
  alert.title = "Vistel Logging";
  alert.message = "Please describe the problem briefly";
  alert.defaultButton = "OK";
  alert.alternateButton = "Cancel";
  alert.textField = UserAlert::TextField{"What happened", "nothing yet"};
  alert.level = 3;
  return alert;
}

AlertRecord record(UserAlert alert) {
  AlertRecord made;
  made.alert = std::move(alert);
  made.posted = WallTime{1714651387251ms};
  made.agent = {1234, 56789};
  return made;
}

TEST(AlertRecordTest, AFileIsOneLineForEachKeyInTheFormOfTheDocument) {
  AlertRecord made = record(question());
  made.alert.information["Path"] = "/a/b.zip";
  made.state = AlertState::answered;
  made.answer = AlertAnswer{AlertResponse::kDefaultButton, "no \"sound\"\nat all"};
  EXPECT_EQ(alertRecordText(made), R"(agentProcess = 1234
agentStart = 56789
alternateButton = "Cancel"
defaultButton = "OK"
displayFlags = 0
identifier = "kind"
level = 3
message = "Please describe the problem briefly"
posted = 1714651387251
state = "answered"
timeout = 0.0
title = "Vistel Logging"

[information]
Path = "/a/b.zip"

[response]
button = "default"
text = "no \"sound\"\nat all"

[textField]
initialValue = "nothing yet"
title = "What happened"
)");
}

TEST(AlertRecordTest, ARecordWithoutAnAnswerSaysWhy) {
  AlertRecord made = record({});
  made.state = AlertState::cutOff;
  EXPECT_THAT(alertRecordText(made),
              ::testing::HasSubstr("reason = \"the agent ended before it was answered\"\n"));
  made.state = AlertState::timedOut;
  EXPECT_THAT(alertRecordText(made), ::testing::HasSubstr("reason = \"nobody answered in time\"\n"));
}

TEST(AlertRecordTest, WhateverTextAnAlertHasComesBackAsItWas) {
  std::string everyCharacter;
  for (char c = 0; c < 0x7f; ++c) everyCharacter += c;
  everyCharacter += "\x7f\xc2\x80\xc3\xa4 \xe2\x80\xa8 \xf0\x9f\x93\x9e '''\"\"\" # [x] = \\u0041";
  AlertRecord made = record(question());
  made.alert.title = everyCharacter;
  made.alert.textField->initialValue = everyCharacter;
  made.alert.information[everyCharacter] = everyCharacter;
  made.alert.timeout = 2.5;
  made.alert.level = -3;
  made.alert.displayFlags = 0xffffffffU;
  made.answer = AlertAnswer{AlertResponse::kCancelled, everyCharacter};
  made.state = AlertState::answered;
  const auto read = parseAlertRecord(alertRecordText(made));
  ASSERT_TRUE(read);
  EXPECT_EQ(read->alert.title, everyCharacter);
  EXPECT_EQ(read->alert.message, made.alert.message);
  EXPECT_EQ(read->alert.textField->initialValue, everyCharacter);
  EXPECT_EQ(read->alert.information, made.alert.information);
  EXPECT_EQ(read->alert.alternateButton, "Cancel");
  EXPECT_EQ(read->alert.otherButton, std::nullopt);
  EXPECT_EQ(read->alert.timeout, 2.5);
  EXPECT_EQ(read->alert.level, -3);
  EXPECT_EQ(read->alert.displayFlags, 0xffffffffU);
  EXPECT_EQ(read->posted, made.posted);
  EXPECT_EQ(read->agent, made.agent);
  EXPECT_EQ(read->state, AlertState::answered);
  ASSERT_TRUE(read->answer);
  EXPECT_EQ(read->answer->code, AlertResponse::kCancelled);
  EXPECT_EQ(read->answer->text, everyCharacter);
}

TEST(AlertRecordTest, EndlessTextsAreCutAtACharacterAndBadOnesAreRepaired) {
  UserAlert alert = question();
  alert.title = "x" + std::string(5000, '\x01');
  alert.message = "y";
  for (int i = 0; i < 3000; ++i) alert.message += "\xc3\xa4";
  alert.defaultButton = "bad \xff byte";
  for (int i = 0; i < 100; ++i) alert.information[std::to_string(i)] = std::string(100'000, 'z');
  alert = boundedAlert(std::move(alert));
  EXPECT_EQ(alert.title.size(), 4096U);
  EXPECT_EQ(alert.message.size(), 4095U);
  EXPECT_TRUE(isUtf8(alert.message));
  EXPECT_EQ(alert.defaultButton, "bad \xEF\xBF\xBD byte");
  EXPECT_EQ(alert.information.size(), 16U);
  EXPECT_LT(alertRecordText(record(alert)).size(), std::size_t{1} << 20U);
}

TEST(AlertRecordTest, WhatIsNoRecordIsNone) {
  const std::string good = alertRecordText(record({}));
  ASSERT_TRUE(parseAlertRecord(good));
  for (const char* key : {"posted", "agentProcess", "agentStart", "state"}) {
    std::string without = good;
    const std::size_t at = without.find(std::string(key) + " = ");
    ASSERT_NE(at, std::string::npos);
    without.erase(at, without.find('\n', at) + 1 - at);
    EXPECT_FALSE(parseAlertRecord(without)) << key;
  }
  for (const char* text : {"", "garbage", "state = \"no such state\"", "[", "\xff\xfe"}) {
    EXPECT_FALSE(parseAlertRecord(text)) << text;
  }
}

TEST(AlertRecordTest, MangledRecordsAreReadOrRefusedButNeverWorse) {
  std::mt19937 random(7);  // NOLINT(cert-msc32-c,cert-msc51-cpp): the same every time
  const std::string good = alertRecordText(record(question()));
  for (int round = 0; round < 2000; ++round) {
    std::string text = good;
    for (int change = 0; change < 4; ++change) text[random() % text.size()] = static_cast<char>(random());
    text.resize(random() % (text.size() + 1));
    const auto read = parseAlertRecord(text);
    if (read) {
      EXPECT_TRUE(parseAlertRecord(alertRecordText(*read)));
    }
    std::string reason;
    (void)parseAlertAnswer(text, reason);
  }
}

TEST(AlertAnswerTest, ComesBackAsItWasGiven) {
  std::string reason;
  const auto answer =
      parseAlertAnswer(alertAnswerText({AlertResponse::kOtherButton, "a\n\"b\"\t\xff"}), reason);
  ASSERT_TRUE(answer);
  EXPECT_EQ(answer->code, AlertResponse::kOtherButton);
  EXPECT_EQ(answer->text, "a\n\"b\"\t\xEF\xBF\xBD");
  EXPECT_THAT(reason, IsEmpty());
}

TEST(AlertAnswerTest, WhatIsNoAnswerIsRefusedWithItsReason) {
  const auto reasonFor = [](const std::string& text) {
    std::string reason;
    EXPECT_FALSE(parseAlertAnswer(text, reason)) << text;
    return reason;
  };
  EXPECT_EQ(reasonFor(""), "it names no button");
  EXPECT_EQ(reasonFor("button = 1"), "it names no button");
  EXPECT_EQ(reasonFor("button = \"ok\\n\""), "there is no button \"ok\\x0a\"");
  EXPECT_EQ(reasonFor("button = \"default\"\ntext = 7"), "its text is none");
  EXPECT_THAT(reasonFor("button = \"default\"\n{{{"), ::testing::StartsWith("line 2: "));
  EXPECT_THAT(reasonFor(std::string("\0\0", 2)), ::testing::StartsWith("line 1: "));
  EXPECT_THAT(reasonFor("a = " + std::string(60'000, '[')), ::testing::StartsWith("line 1: "));
}

TEST(AlertButtonTest, NamesAndNumbersBelongTogether) {
  for (int code = 0; code < 4; ++code) EXPECT_EQ(alertButtonCode(alertButtonName(code)), code);
  EXPECT_EQ(alertButtonName(AlertResponse::kDefaultButton), "default");
  EXPECT_EQ(alertButtonName(AlertResponse::kAlternateButton), "alternate");
  EXPECT_EQ(alertButtonName(AlertResponse::kOtherButton), "other");
  EXPECT_EQ(alertButtonName(AlertResponse::kCancelled), "cancel");
  EXPECT_EQ(alertButtonCode("Default"), std::nullopt);
  EXPECT_EQ(alertButtonCode(""), std::nullopt);
}

}  // namespace
}  // namespace zal
