#include "platform/linux/alerts/alert_screens.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/linux/alerts/recording_alert_screen.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class AlertScreensTest : public ::testing::Test {
 protected:
  void present(const std::string& id) {
    UserAlert alert;
    alert.title = "Title";
    screens.present(id, alert,
                    {.onAnswer =
                         [this, id](const AlertAnswer& answer) {
                           told.push_back(id + " answered " + std::to_string(answer.code));
                         },
                     .onDeclined = [this, id] { told.push_back(id + " declined"); }});
  }

  testing::RecordingAlertScreen first, second;
  AlertScreens screens{{&first, &second}};
  std::vector<std::string> told;
};

TEST_F(AlertScreensTest, TheFirstScreenHasIt) {
  present("1");
  first.answer("1", {AlertResponse::kAlternateButton});
  EXPECT_THAT(first.events, ElementsAre("show 1 Title"));
  EXPECT_THAT(second.events, IsEmpty());
  EXPECT_THAT(told, ElementsAre("1 answered 1"));
}

TEST_F(AlertScreensTest, WhatOneDeclinesAtOnceOrLaterGoesToTheNext) {
  first.declines = true;
  present("1");
  first.declines = false;
  present("2");
  first.decline("2");
  EXPECT_THAT(second.events, ElementsAre("show 1 Title", "show 2 Title"));
  second.answer("2", {AlertResponse::kDefaultButton});
  second.decline("1");
  EXPECT_THAT(told, ElementsAre("2 answered 0", "1 declined"));
}

TEST_F(AlertScreensTest, WithdrawnIsOnlyWhereItIsAndNobodyIsTold) {
  present("1");
  present("2");
  first.decline("2");
  screens.withdraw("1");
  screens.withdraw("2");
  screens.withdraw("2");
  screens.withdraw("7");
  EXPECT_THAT(first.events, ElementsAre("show 1 Title", "show 2 Title", "withdraw 1"));
  EXPECT_THAT(second.events, ElementsAre("show 2 Title", "withdraw 2"));
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(AlertScreensTest, AnAnswerAfterTheEndReachesNobody) {
  present("1");
  screens.agentEnds();
  first.answer("1", {});
  EXPECT_THAT(first.events, ElementsAre("show 1 Title", "end"));
  EXPECT_THAT(second.events, ElementsAre("end"));
  EXPECT_THAT(told, IsEmpty());
}

TEST_F(AlertScreensTest, WithoutAnyScreenEverythingIsDeclined) {
  AlertScreens none({});
  int declined = 0;
  none.present("1", {}, {.onAnswer = [](const AlertAnswer&) {}, .onDeclined = [&] { ++declined; }});
  none.withdraw("1");
  EXPECT_EQ(declined, 1);
}

}  // namespace
}  // namespace zal
