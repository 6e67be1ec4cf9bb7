#include "platform/linux/bus_module/announced_dump_progress.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace zal {
namespace {

using ::testing::ElementsAre;

/// Records that only note what they are told.
class NotedProgress : public DumpProgress {
 public:
  explicit NotedProgress(std::vector<std::string>& notes) : _notes(notes) {}
  void step(std::size_t number) override { _notes.push_back("step " + std::to_string(number)); }
  void missing(std::string_view what, std::string_view) override {
    _notes.push_back("missing " + std::string(what));
  }
  void done(const std::string& archivePath) override { _notes.push_back("done " + archivePath); }
  void failed(std::string_view reason) override { _notes.push_back("failed " + std::string(reason)); }

 private:
  std::vector<std::string>& _notes;
};

class AnnouncedDumpProgressTest : public ::testing::Test, public DumpProgressRecords {
 protected:
  std::shared_ptr<DumpProgress> begin(DumpPlan plan) override {
    notes.push_back("begin " + plan.service);
    return std::make_shared<NotedProgress>(notes);
  }
  std::shared_ptr<DumpProgress> dump() {
    return announced.begin({.service = "Vistel", .directory = "/r/V", .steps = {"Network state", "Archive"}});
  }

  std::vector<std::string> notes;
  std::vector<std::string> news;
  AnnouncedDumpProgress announced{*this, [this](const DumpNews& said) {
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
  EXPECT_THAT(notes,
              ElementsAre("begin Vistel", "step 1", "missing the radio's state", "step 2", "done /r/V.zip"));
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

TEST_F(AnnouncedDumpProgressTest, AStepBeyondThePlanHasNoName) {
  dump()->step(3);
  EXPECT_EQ(news.at(1), "step 3/2 [] []");
}

TEST_F(AnnouncedDumpProgressTest, AHundredMissingThingsAreToldThenThatThereAreMore) {
  const auto progress = dump();
  for (int i = 1; i <= 300; ++i) progress->missing(std::to_string(i), "gone");
  EXPECT_EQ(news.size(), 102U);
  EXPECT_EQ(news[100], "missing 0/2 [100] [gone]");
  EXPECT_EQ(news[101], "missing 0/2 [more] [the progress record has the whole list]");
  EXPECT_EQ(notes.size(), 301U);
}

}  // namespace
}  // namespace zal
