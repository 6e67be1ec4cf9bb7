#include "platform/linux/progress/progress_record.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <random>

namespace zal {
namespace {

using namespace std::chrono_literals;
using State = DumpProgressRecord::State;

constexpr WallTime kBegin{1714651387251ms};

std::string begin(const std::vector<std::string>& steps = {"Network state", "Crash reports", "Archive"}) {
  return progressBeginText("Vistel", "/reports/a b", steps, kBegin, {1234, 56789});
}

TEST(ProgressRecordTest, TheLinesAreThoseOfTheDocument) {
  EXPECT_EQ(begin() + progressStepText(1, kBegin + 1ms) +
                progressMissingText("the radio's state", "no modem") +
                progressDoneText("/reports/a b.zip", kBegin + 2s),
            "BEGIN 1714651387251 pid=1234 start=56789 steps=3 service=Vistel directory=/reports/a\\x20b\n"
            "PLAN 1 Network state\n"
            "PLAN 2 Crash reports\n"
            "PLAN 3 Archive\n"
            "STEP 1 1714651387252\n"
            "MISSING the radio's state\tno modem\n"
            "OK 1714651389251 /reports/a b.zip\n");
  EXPECT_EQ(progressFailedText("no space", kBegin), "FAILED 1714651387251 no space\n");
  EXPECT_EQ(progressCutOffText(kBegin), "CUT 1714651387251\n");
}

TEST(ProgressRecordTest, ARunningRecordTellsItsPlanAndWhereItIs) {
  const auto record = parseDumpProgress(begin() + progressStepText(1, kBegin + 10ms) +
                                        progressMissingText("a", "b") + progressStepText(2, kBegin + 20ms));
  ASSERT_TRUE(record);
  EXPECT_EQ(record->service, "Vistel");
  EXPECT_EQ(record->directory, "/reports/a b");
  EXPECT_EQ(record->began, kBegin);
  EXPECT_EQ(record->agent, (ProcessIdentity{1234, 56789}));
  ASSERT_EQ(record->steps.size(), 3U);
  EXPECT_EQ(record->steps[1].name, "Crash reports");
  EXPECT_EQ(record->steps[0].began, kBegin + 10ms);
  EXPECT_EQ(record->steps[2].began, std::nullopt);
  EXPECT_EQ(record->currentStep, 2U);
  ASSERT_EQ(record->missing.size(), 1U);
  EXPECT_EQ(record->missing[0].what, "a");
  EXPECT_EQ(record->missing[0].why, "b");
  EXPECT_EQ(record->state, State::running);
  EXPECT_EQ(record->ended, std::nullopt);
}

TEST(ProgressRecordTest, EachEndIsItsOwnAndTheFirstOneCounts) {
  const auto done = parseDumpProgress(begin() + progressDoneText("/a b.zip", kBegin + 1s) +
                                      progressFailedText("late", kBegin + 2s) + progressStepText(3, kBegin));
  ASSERT_TRUE(done);
  EXPECT_EQ(done->state, State::done);
  EXPECT_EQ(done->archivePath, "/a b.zip");
  EXPECT_EQ(done->ended, kBegin + 1s);
  EXPECT_EQ(done->currentStep, 0U);
  const auto failed = parseDumpProgress(begin() + progressFailedText("no space left", kBegin + 2s));
  ASSERT_TRUE(failed);
  EXPECT_EQ(failed->state, State::failed);
  EXPECT_EQ(failed->reason, "no space left");
  EXPECT_EQ(parseDumpProgress(begin() + progressCutOffText(kBegin))->state, State::cutOff);
}

TEST(ProgressRecordTest, ClientTextCannotMakeLinesOfItsOwn) {
  const std::string hostile = "x\nOK 1 /evil\r\\x0a\t\x01\xff \xc2\x85 y\\";
  const std::string text =
      progressBeginText(hostile, hostile, {hostile}, kBegin, {1, 2}) + progressMissingText(hostile, hostile);
  EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 3);
  EXPECT_EQ(std::count(text.begin(), text.end(), '\t'), 1);
  const auto record = parseDumpProgress(text);
  ASSERT_TRUE(record);
  EXPECT_EQ(record->service, hostile);
  EXPECT_EQ(record->directory, hostile);
  EXPECT_EQ(record->steps.at(0).name, hostile);
  EXPECT_EQ(record->missing.at(0).what, hostile);
  EXPECT_EQ(record->missing.at(0).why, hostile);
  EXPECT_EQ(parseDumpProgress(begin() + progressDoneText(hostile, kBegin))->archivePath, hostile);
}

TEST(ProgressRecordTest, EndlessTextsAreCut) {
  EXPECT_EQ(progressMissingText(std::string(5000, 'x'), "y"), "MISSING " + std::string(4096, 'x') + "\ty\n");
}

TEST(ProgressRecordTest, EveryCutOfARecordReadsAsTheLinesThatAreWhole) {
  const std::string whole = begin() + progressStepText(1, kBegin) + progressMissingText("a", "b") +
                            progressStepText(12, kBegin) + progressDoneText("/a.zip", kBegin);
  const std::size_t firstLine = whole.find('\n') + 1;
  for (std::size_t length = 0; length <= whole.size(); ++length) {
    const auto record = parseDumpProgress(whole.substr(0, length));
    EXPECT_EQ(record.has_value(), length >= firstLine) << length;
    if (record) {
      EXPECT_EQ(record->state, length == whole.size() ? State::done : State::running) << length;
    }
  }
}

TEST(ProgressRecordTest, LinesThatAreNotUnderstoodArePassedOver) {
  const auto record = parseDumpProgress(begin({"one"}) +
                                        "\nSTEP\nSTEP 0 1\nSTEP 2 1\nSTEP -1 1\nSTEP 99999999999999999999 1\n"
                                        "PLAN\nPLAN 5 five\nLATER 1 2\nMISSING\nstep 1 1\nSTEP 1 never\n");
  ASSERT_TRUE(record);
  EXPECT_EQ(record->state, State::running);
  EXPECT_EQ(record->currentStep, 1U);
  EXPECT_EQ(record->steps.at(0).began, std::nullopt);
  EXPECT_EQ(record->steps.at(0).name, "one");
  EXPECT_EQ(record->missing.size(), 1U);
}

TEST(ProgressRecordTest, AnEndlessPlanIsNotBelieved) {
  const auto record = parseDumpProgress("BEGIN 1 steps=18446744073709551615 service=x\n");
  ASSERT_TRUE(record);
  EXPECT_EQ(record->steps.size(), 10'000U);
}

TEST(ProgressRecordTest, WhatDoesNotBeginWithABeginIsNoRecord) {
  for (const char* text : {"", "\n", "BEGIN", "BEGIN\n", "BEGIN x\n", "BEGIN -1 pid=1\n", "STEP 1 1\n",
                           "BEGIN 99999999999999999\n", " BEGIN 1\n"}) {
    EXPECT_FALSE(parseDumpProgress(text)) << text;
  }
}

TEST(ProgressRecordTest, RandomBytesAndMangledRecordsNeverDoHarm) {
  std::mt19937 random(11);  // NOLINT(cert-msc32-c,cert-msc51-cpp): the same every time
  const std::string good = begin() + progressStepText(1, kBegin) + progressMissingText("a", "b") +
                           progressStepText(2, kBegin) + progressDoneText("/a.zip", kBegin);
  std::size_t records = 0;
  for (int round = 0; round < 20'000; ++round) {
    std::string text = good;
    if (round % 2 == 0) {
      text.resize(random() % 200);
      for (char& byte : text) byte = static_cast<char>(random());
      if (round % 4 == 0) text = "BEGIN 1 " + text;
    } else {
      for (int change = 0; change < 3; ++change) text[random() % text.size()] = static_cast<char>(random());
    }
    const auto record = parseDumpProgress(text);
    if (!record) continue;
    ++records;
    EXPECT_LE(record->currentStep, record->steps.size());
    EXPECT_LE(record->steps.size(), 10'000U);
  }
  EXPECT_GT(records, 1000U);
}

}  // namespace
}  // namespace zal
