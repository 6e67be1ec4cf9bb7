// The action that makes a dump for a user, from the request to the start of the dump.

#include <gmock/gmock.h>

#include "dump/planned_steps.h"
#include "tests/dump/action_fixture.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr std::int64_t kDump = 14;
constexpr const char* kCaptured = "Logs have been successfully captured and stored in this file: ";

class UserDumpTest : public testing::ActionFixture {
 protected:
  void dump(const ValueMap& info) { perform(kDump, "Vistel", info); }
  static ValueMap displayFlags(std::int64_t flags) { return {{"displayFlags", flags}}; }
  [[nodiscard]] bool isCollecting() const { return !fake.dumpProgress.plans.empty(); }
  [[nodiscard]] std::string archive(const std::string& description) const {
    return root + "/Vistel/Vistel-Log (" + kTime + ")" +
           (description.empty() ? "" : " (" + description + ")") + ".zip";
  }
  /// The completion alert of a dump with the session type as its description.
  [[nodiscard]] static std::string completionAlert() {
    return std::string("CopyLogs | Vistel Logging | ") + kCaptured + "Vistel-Log (" + kTime +
           ") (Vistel).zip";
  }
  static constexpr const char* kPrompt =
      "__ksLirraUserInputNotificationForTitleAndMessageIdentifier | Vistel Logging | "
      "Please describe the problem briefly";
};

TEST_F(UserDumpTest, WithoutASessionTypeNothingHappens) {
  perform(kDump, std::nullopt, displayFlags(3));
  perform(kDump, "", displayFlags(3));
  finish();
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fakePeer->replies, IsEmpty());
  EXPECT_FALSE(isCollecting());
}

TEST_F(UserDumpTest, DisplayFlags2StartAtOnceWithTheTypeAsDescriptionAndEndWithAnAlertOnAnyInstall) {
  for (const bool internal : {false, true}) {
    fake.configuration.internalInstall = internal;
    fake.userAlerts.posted.clear();
    fakePeer->replies.clear();
    std::filesystem::remove_all(root);
    fake.host.setWall(WallTime(std::chrono::milliseconds{1714651387251}));
    dump(displayFlags(2));
    EXPECT_THAT(alertTexts(), IsEmpty());
    EXPECT_TRUE(isCollecting());
    finish();
    EXPECT_THAT(alertTexts(), ElementsAre(completionAlert()));
    EXPECT_THAT(fakePeer->replies, SizeIs(1));
  }
}

TEST_F(UserDumpTest, DisplayFlags1PromptAndEndWithoutAnAlert) {
  dump(displayFlags(1));
  EXPECT_THAT(alertTexts(), ElementsAre(kPrompt));
  EXPECT_FALSE(isCollecting());
  answerPrompt(AlertResponse::kDefaultButton, "no sound");
  finish();
  EXPECT_THAT(alertTexts(), ElementsAre(kPrompt));
  EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithPath(archive("no sound")))));
}

TEST_F(UserDumpTest, DisplayFlags3PromptAndEndWithAnAlert) {
  dump(displayFlags(3));
  answerPrompt(AlertResponse::kDefaultButton, "Vistel");
  finish();
  EXPECT_THAT(alertTexts(), ElementsAre(kPrompt, completionAlert()));
}

TEST_F(UserDumpTest, DisplayFlags4NeitherPromptNorAlert) {
  dump(displayFlags(4));
  finish();
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fakePeer->replies, SizeIs(1));
}

TEST_F(UserDumpTest, WithoutDisplayFlagsAnInternalInstallGetsNeitherPromptNorAlert) {
  fake.configuration.internalInstall = true;
  dump({});
  finish();
  EXPECT_THAT(alertTexts(), IsEmpty());
  EXPECT_THAT(fake.systemNotifications.posts, IsEmpty());
  EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithPath(archive("Vistel")))));
}

TEST_F(UserDumpTest, WithoutDisplayFlagsEveryOtherInstallGetsBoth) {
  performWith(kDump, "Vistel", nullptr, &message);
  EXPECT_THAT(alertTexts(), ElementsAre(kPrompt));
  answerPrompt(AlertResponse::kDefaultButton, "Vistel");
  finish();
  EXPECT_THAT(alertTexts(), ElementsAre(kPrompt, completionAlert()));
}

TEST_F(UserDumpTest, CancelEndsItWithNoDumpAndNoReply) {
  for (const int code :
       {AlertResponse::kAlternateButton, AlertResponse::kOtherButton, AlertResponse::kCancelled}) {
    fake.userAlerts.posted.clear();
    dump(displayFlags(1));
    answerPrompt(code, "no sound");
    finish();
  }
  EXPECT_FALSE(isCollecting());
  EXPECT_THAT(fakePeer->replies, IsEmpty());
}

TEST_F(UserDumpTest, AnAnswerWithoutTextIsADumpWithoutADescription) {
  for (const Value& answer : {Value(""), Value(), Value(std::int64_t{5})}) {
    fake.userAlerts.posted.clear();
    fakePeer->replies.clear();
    fake.host.setWall(WallTime(std::chrono::milliseconds{1714651387251}));
    dump(displayFlags(1));
    answerPrompt(AlertResponse::kDefaultButton, answer);
    finish();
    EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithPath(archive("")))));
  }
}

TEST_F(UserDumpTest, ThePromptHasTheClientsTitleAndTwoButtons) {
  dump({{"displayFlags", std::int64_t{1}}, {"title", "Video trouble"}});
  ASSERT_THAT(alerts(), SizeIs(1));
  EXPECT_EQ(alerts()[0].title, "Video trouble");
  EXPECT_EQ(alerts()[0].defaultButton, "OK");
  EXPECT_EQ(alerts()[0].alternateButton, "Cancel");
  EXPECT_TRUE(alerts()[0].textField);
}

TEST_F(UserDumpTest, TheTimeIsThatOfTheRequestNotOfTheAnswer) {
  dump(displayFlags(1));
  fake.host.advance(std::chrono::hours{1});
  answerPrompt(AlertResponse::kDefaultButton, "late");
  finish();
  EXPECT_THAT(fakePeer->replies, ElementsAre(std::pair(kToken, replyWithPath(archive("late")))));
}

TEST_F(UserDumpTest, FlagsAre32BitsOfWhateverIsSent) {
  dump({{"displayFlags", std::int64_t{4}}, {"collectionFlags", std::int64_t{0x1'0000'0008}}});
  EXPECT_EQ(fake.dumpProgress.plans.at(0).steps, wantedNames(ServiceCollection::plan({.service = "Vistel",
                                                                                      .destination = "",
                                                                                      .reason = std::nullopt,
                                                                                      .background = false,
                                                                                      .flags = 0x8})));
}

TEST_F(UserDumpTest, OnlyAReportFlagFilesAReport) {
  dump({{"displayFlags", std::int64_t{4}}, {"collectionFlags", std::int64_t{0xB80}}});
  finish();
  EXPECT_THAT(reports, IsEmpty());
  dump({{"displayFlags", std::int64_t{4}}, {"collectionFlags", std::int64_t{0x400}}});
  finish();
  EXPECT_THAT(reports, SizeIs(1));
}

TEST_F(UserDumpTest, AReportHasTheClientsComponentOrTheUsualOne) {
  const ValueMap base{{"displayFlags", std::int64_t{4}}, {"collectionFlags", std::int64_t{0x400}}};
  dump(base);
  ValueMap named = base;
  named["borroComponent"] = "Calls";
  named["borroComponentVersion"] = "2.5";
  dump(named);
  finish();
  EXPECT_THAT(reports, ElementsAre("Vistel | Orvo Messages (New Bugs) | 1.0 | " + archive("Vistel"),
                                   "Vistel | Calls | 2.5 | " + archive("Vistel")));
}

}  // namespace
}  // namespace zal
