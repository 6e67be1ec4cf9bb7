#include "platform/linux/bus_module/announced_dump_progress.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/support/fake_dump_services.h"

namespace zal {
namespace {

using ::testing::ElementsAre;

class AnnouncedDumpProgressTest : public ::testing::Test {
 protected:
  std::shared_ptr<DumpProgress> dump() {
    return announced.begin({.service = "Vistel", .directory = "/r/V", .steps = {"Network state", "Archive"}});
  }

  testing::RecordingDumpProgress records;
  std::vector<std::string> news;
  AnnouncedDumpProgress announced{records, [this](const DumpNews& said) {
                                    EXPECT_EQ(said.directory, "/r/V");
                                    EXPECT_EQ(said.service, "Vistel");
                                    news.push_back(said.event + " " + std::to_string(said.step) + "/" +
                                                   std::to_string(said.steps) + " [" + said.what + "] [" +
                                                   said.detail + "]");
                                  }};
};

TEST_F(AnnouncedDumpProgressTest, TellsWhatTheRecordIsTold) {
  const auto progress = dump();
  progress->step(1);
  progress->missing("the radio's state", "there is no modem");
  progress->step(2);
  progress->done("/r/V.zip");
  EXPECT_THAT(news, ElementsAre("begin 0/2 [] []", "step 1/2 [Network state] []",
                                "missing 1/2 [the radio's state] [there is no modem]",
                                "step 2/2 [Archive] []", "done 2/2 [] [/r/V.zip]"));
  EXPECT_THAT(records.lines,
              ElementsAre("BEGIN Vistel /r/V", "STEP 1 Network state",
                          "MISSING the radio's state: there is no modem", "STEP 2 Archive", "OK /r/V.zip"));
}

TEST_F(AnnouncedDumpProgressTest, AfterTheEndNothingIsTold) {
  auto progress = dump();
  progress->failed("the disk is full");
  progress->step(1);
  progress->missing("a", "b");
  progress->done("/late.zip");
  progress.reset();
  EXPECT_THAT(news, ElementsAre("begin 0/2 [] []", "failed 0/2 [] [the disk is full]"));
}

TEST_F(AnnouncedDumpProgressTest, WhatGoesWithoutAWordIsCutOff) {
  auto progress = dump();
  progress->step(1);
  progress.reset();
  EXPECT_EQ(news.back(), "cut off 1/2 [] []");
}

TEST_F(AnnouncedDumpProgressTest, AHundredMissingThingsAreToldThenThatThereAreMore) {
  const auto progress = dump();
  for (int i = 1; i <= 300; ++i) progress->missing(std::to_string(i), "gone");
  EXPECT_EQ(news.size(), 102U);
  EXPECT_EQ(news[100], "missing 0/2 [100] [gone]");
  EXPECT_EQ(news[101], "missing 0/2 [more] [the progress record has the whole list]");
  EXPECT_EQ(records.lines.size(), 301U);
}

}  // namespace
}  // namespace zal
