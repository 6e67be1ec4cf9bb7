#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/linux/alerts/alert_store_fixture.h"
#include "tests/linux/alerts/recording_alert_screen.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

/// With a screen beside the directory.
class ShownAlertsTest : public testing::AlertStoreFixture {
 protected:
  ShownAlertsTest() { store->showOn(screen); }
  testing::RecordingAlertScreen screen;
};

TEST_F(ShownAlertsTest, EachAlertIsRecordedAndShown) {
  post(question("Q"));
  post(notice("N"));
  EXPECT_THAT(screen.events, IsEmpty());
  settle();
  EXPECT_EQ(states(), "1 waiting\n2 waiting\n");
  EXPECT_THAT(screen.events, ElementsAre("show 1 Q", "show 2 N"));
}

TEST_F(ShownAlertsTest, AnAnswerOnTheScreenIsTheRecordsAnswerToo) {
  post(question());
  settle();
  screen.answer("1", {AlertResponse::kDefaultButton, "no sound"});
  EXPECT_EQ(answer("1", "default", "too late"), "Alert 1 has been answered already.");
  settle();
  EXPECT_THAT(given, ElementsAre(Given{0, "no sound"}));
  EXPECT_EQ(states(), "1 answered\n");
  EXPECT_THAT(recordText("1"), ::testing::HasSubstr("[response]\nbutton = \"default\"\nfrom = \"screen\"\n"
                                                    "text = \"no sound\"\n"));
  const auto record = readAlert(directory, "1");
  ASSERT_TRUE(record && record->answer);
  EXPECT_TRUE(record->answer->isFromScreen);
  EXPECT_THAT(screen.events, ElementsAre("show 1 Title"));
}

TEST_F(ShownAlertsTest, AnAnswerFromTheDirectoryTakesItFromTheScreen) {
  post(question());
  settle();
  EXPECT_EQ(answer("1", "cancel"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(screen.events, ElementsAre("show 1 Title", "withdraw 1"));
  EXPECT_FALSE(readAlert(directory, "1")->answer->isFromScreen);
}

TEST_F(ShownAlertsTest, OfTwoAnswersAtOnceTheScreensIsTheOnlyOne) {
  post(question());
  settle();
  EXPECT_EQ(answer("1", "default", "file"), std::nullopt);
  screen.answer("1", {AlertResponse::kDefaultButton, "screen"});
  settle();
  settle();
  EXPECT_THAT(given, ElementsAre(Given{0, "screen"}));
  EXPECT_EQ(testing::listTree(directory), "1.toml\n");
}

TEST_F(ShownAlertsTest, AnAlertThatRunsOutDisappears) {
  UserAlert alert = question();
  alert.timeout = 0.01;
  post(alert);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(screen.events, ElementsAre("show 1 Title", "withdraw 1"));
}

TEST_F(ShownAlertsTest, AScreenThatDeclinesLeavesItToTheDirectory) {
  screen.declines = true;
  post(question());
  settle();
  EXPECT_EQ(states(), "1 waiting\n");
  EXPECT_EQ(answer("1", "default", "heard"), std::nullopt);
  runUntil([&] { return !given.empty(); });
  EXPECT_THAT(given, ElementsAre(Given{0, "heard"}));
}

TEST_F(ShownAlertsTest, TheScreenHearsOfTheEndAndNobodyIsTold) {
  post(question());
  settle();
  store->cutOffWaiting();
  screen.answer("1", {});
  settle();
  EXPECT_THAT(screen.events, ElementsAre("show 1 Title", "end"));
  EXPECT_THAT(given, IsEmpty());
  EXPECT_EQ(states(), "1 cut off\n");
}

TEST_F(ShownAlertsTest, AButtonThatTheAlertDoesNotHaveAnswersNothing) {
  post(notice());
  settle();
  const auto handlers = screen.shown.at("1");
  handlers.onAnswer({AlertResponse::kOtherButton});
  settle();
  EXPECT_EQ(states(), "1 waiting\n");
}

TEST_F(ShownAlertsTest, TextsFromTheScreenAreBoundedAndWellFormed) {
  post(question());
  settle();
  screen.answer("1", {AlertResponse::kDefaultButton, "\xff" + std::string(100'000, 'x')});
  settle();
  ASSERT_THAT(given, SizeIs(1));
  const auto text = std::get<std::string>(given[0].text.storage);
  EXPECT_EQ(text.substr(0, 4), "\xEF\xBF\xBDx");
  EXPECT_EQ(text.size(), 65'536U + 2U);
}

TEST_F(ShownAlertsTest, AnOldNoticeGoesFromTheScreenWithItsRecord) {
  for (int i = 0; i < 51; ++i) post(notice());
  settle();
  EXPECT_EQ(screen.events.back(), "withdraw 1");
  EXPECT_EQ(screen.shown.size(), 50U);
}

}  // namespace
}  // namespace zal
