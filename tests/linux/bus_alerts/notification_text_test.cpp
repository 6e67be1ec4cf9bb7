#include "platform/linux/bus/alerts/notification_text.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zal {
namespace {

using ::testing::ElementsAre;

UserAlert notice() {
  UserAlert alert;
  alert.title = "Vistel Logging";
  alert.message = "Logs";
  alert.defaultButton = "OK";
  return alert;
}

constexpr NotificationAbilities kAll{true, true, true};

TEST(NotificationTextTest, ButtonsAreActionsByTheirNames) {
  UserAlert alert = notice();
  EXPECT_THAT(notificationText(alert, kAll).actions, ElementsAre("default", "OK"));
  alert.alternateButton = "Cancel";
  alert.otherButton = "Later";
  EXPECT_THAT(notificationText(alert, kAll).actions,
              ElementsAre("default", "OK", "alternate", "Cancel", "other", "Later"));
  EXPECT_EQ(notificationButton("default"), AlertResponse::kDefaultButton);
  EXPECT_EQ(notificationButton("alternate"), AlertResponse::kAlternateButton);
  EXPECT_EQ(notificationButton("other"), AlertResponse::kOtherButton);
  EXPECT_EQ(notificationButton("cancel"), std::nullopt);
  EXPECT_EQ(notificationButton("inline-reply"), std::nullopt);
}

TEST(NotificationTextTest, TheLevelIsTheUrgency) {
  UserAlert alert = notice();
  std::vector<int> urgencies;
  for (const int level : {-1, 0, 1, 2, 3, 7}) {
    alert.level = level;
    urgencies.push_back(notificationText(alert, kAll).urgency);
  }
  EXPECT_THAT(urgencies, ElementsAre(1, 1, 1, 2, 2, 2));
}

TEST(NotificationTextTest, OnlyAServerThatReadsMarkupGetsItEscaped) {
  UserAlert alert = notice();
  alert.title = "<b>&";
  alert.message = "a & <b>b</b> &amp;\n-x";
  EXPECT_EQ(notificationText(alert, kAll).body, "a &amp; &lt;b&gt;b&lt;/b&gt; &amp;amp;\n-x");
  EXPECT_EQ(notificationText(alert, kAll).summary, "<b>&");
  EXPECT_EQ(notificationText(alert, {true, true, false}).body, alert.message);
}

TEST(NotificationTextTest, AServerWithoutABodyHasTheMessageInTheTitle) {
  const NotificationText text = notificationText(notice(), {true, false, false});
  EXPECT_EQ(text.summary, "Vistel Logging: Logs");
  EXPECT_EQ(text.body, "");
}

TEST(NotificationTextTest, HostileTextsAreBoundedAndHarmless) {
  UserAlert alert = notice();
  alert.title = std::string(4096, 't');
  alert.message = std::string("\x1b[2J\0\x01", 6) + std::string(4096, '<');
  alert.defaultButton = std::string(4096, 'b');
  const NotificationText text = notificationText(alert, kAll);
  EXPECT_EQ(text.summary, std::string(120, 't') + "\xE2\x80\xA6");
  EXPECT_EQ(text.body.substr(0, 10), " [2J  &lt;");
  EXPECT_LT(text.body.size(), 4100U);
  EXPECT_EQ(text.actions[1].size(), 43U);
}

TEST(NotificationTextTest, AbilitiesAreReadByName) {
  const auto some = notificationAbilities({"actions", "body-markup", "unheard-of"});
  EXPECT_TRUE(some.hasActions);
  EXPECT_FALSE(some.hasBody);
  EXPECT_TRUE(some.readsMarkup);
}

}  // namespace
}  // namespace zal
