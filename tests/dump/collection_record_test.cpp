#include "dump/collection_record.h"

#include "dump/planned_steps.h"
#include "tests/dump/collection_fixture.h"

namespace zal {
namespace {

using Lines = std::vector<std::string>;
using namespace std::chrono_literals;

class CollectionRecordTest : public testing::CollectionFixture {
 protected:
  static PlannedStep wanted(const char* name) { return {name, true, "no"}; }

  [[nodiscard]] PartState stateOf(std::size_t step) const { return record->account().steps.at(step).state; }
  void takes(const std::string& source, SourceOutcome outcome) {
    collectors.witnesses.source(source, directory + "/Phone", outcome, "why");
  }

  const std::string directory = host.home / "dump";
  std::shared_ptr<CollectionRecord> record =
      beginRecord(host.platform, collectors.witnesses,
                  {.service = "Vistel",
                   .directory = directory,
                   .flags = 1,
                   .steps = {wanted("First"), {"Second", false, "flag 0x2 is not set"}, wanted("Third")}});
};

TEST_F(CollectionRecordTest, StepsHaveTheirTimesAndThoseThatAreSkippedTheirReason) {
  record->step(1);
  advance(1500ms);
  record->step(2);
  advance(20ms);
  const auto steps = record->account().steps;
  EXPECT_EQ(steps[0].duration, 1500ms);
  EXPECT_EQ(steps[0].state, PartState::done);
  EXPECT_EQ(steps[1].state, PartState::skipped);
  EXPECT_EQ(steps[1].why, Lines{"flag 0x2 is not set"});
  EXPECT_EQ(steps[1].began, std::nullopt);
  EXPECT_EQ(steps[2].began, *steps[0].began + 1500ms);
  EXPECT_EQ(steps[2].duration, 20ms);
}

TEST_F(CollectionRecordTest, StepWhoseTurnNeverCameDidNotRun) {
  record->step(1);
  EXPECT_EQ(stateOf(2), PartState::notRun);
}

TEST_F(CollectionRecordTest, StepWithoutAnyOfItsSourcesIsMissing) {
  record->step(1);
  takes("/a", SourceOutcome::absent);
  EXPECT_EQ(stateOf(0), PartState::missing);
  takes("/b", SourceOutcome::taken);
  EXPECT_EQ(stateOf(0), PartState::done);
}

TEST_F(CollectionRecordTest, StepWithASourceThatCouldNotBeTakenIsPartial) {
  record->step(1);
  takes("/a", SourceOutcome::taken);
  takes("/b", SourceOutcome::failed);
  EXPECT_EQ(stateOf(0), PartState::partial);
  EXPECT_EQ(record->account().sources.at(1).why, "why");
  EXPECT_EQ(record->account().sources.at(1).directory, "Phone");
}

TEST_F(CollectionRecordTest, StepThatGivesNothingSaysWhyInTheProgressRecordToo) {
  record->step(2);
  record->stepGives(PartState::failed, "it was refused");
  EXPECT_EQ(stateOf(2), PartState::failed);
  EXPECT_EQ(host.dumpProgress.lines.back(), "MISSING Third: it was refused");
}

TEST_F(CollectionRecordTest, CommandThatIsWaitedForShowsItsStatus) {
  record->step(1);
  int status = 3 << 8;
  host.shell.respond = [&](const std::string&) { return status; };
  collectors.commands.RunCommandAndWait("false", directory, "false.txt");
  status = 9;
  collectors.commands.RunCommandAndWait("crash", directory, "crash.txt");
  status = -1;
  collectors.commands.RunCommandAndWait("no shell", directory, "none.txt");
  status = 0;
  collectors.commands.RunCommandAndWait("true", directory, "true.txt");
  const auto commands = record->account().commands;
  EXPECT_EQ(commands[0].exitStatus, 3);
  EXPECT_EQ(commands[0].state, PartState::failed);
  EXPECT_EQ(commands[1].exitStatus, std::nullopt);
  EXPECT_EQ(commands[1].why, "signal 9 ended it");
  EXPECT_EQ(commands[2].why, "it could not be started");
  EXPECT_EQ(commands[3].exitStatus, 0);
  EXPECT_EQ(commands[3].state, PartState::done);
  EXPECT_EQ(stateOf(0), PartState::partial);
}

TEST_F(CollectionRecordTest, CommandsOutputTellsWhetherItsProgramIsThereAndWhetherItStillRuns) {
  record->step(1);
  collectors.commands.RunCommandInBackground("voltra", directory + "/Network", "voltra.txt");
  collectors.commands.RunCommandInBackground("traceroute", directory + "/Network", "trace.txt");
  record->step(2);
  record->output("Network/voltra.txt", PartState::missing, "voltra: not found");
  record->output("Network/trace.txt", PartState::running, "still running");
  record->output("capture.txt", PartState::running, "started by somebody else");
  const auto account = record->account();
  EXPECT_EQ(account.commands[0].state, PartState::missing);
  EXPECT_EQ(account.commands[0].exitStatus, std::nullopt);
  EXPECT_EQ(account.commands[1].state, PartState::running);
  EXPECT_EQ(account.commands[2].line, "");
  EXPECT_EQ(account.steps[0].state, PartState::partial);
  EXPECT_EQ(account.steps[2].state, PartState::done);
}

TEST_F(CollectionRecordTest, WhatComesLateBelongsToTheStepThatKeepsTheDirectory) {
  record->step(1);
  record->keepForThisStep(directory + "/Network");
  record->step(2);
  collectors.commands.RunCommandInBackground("late", directory + "/Network/Console", "late.txt");
  collectors.commands.RunCommandInBackground("now", directory + "/Networks", "now.txt");
  const auto commands = record->account().commands;
  EXPECT_EQ(commands[0].step, 0U);
  EXPECT_EQ(commands[1].step, 2U);
}

TEST_F(CollectionRecordTest, HearsNothingOfOtherDirectories) {
  record->step(1);
  collectors.commands.RunCommandInBackground("other", directory + " 2", "x.txt");
  EXPECT_TRUE(record->account().commands.empty());
}

TEST_F(CollectionRecordTest, RowsBeyondTheLimitAreCounted) {
  record->step(1);
  for (std::size_t i = 0; i < CollectionRecord::kMostRows + 2; ++i) takes("/a", SourceOutcome::taken);
  EXPECT_EQ(record->account().sources.size(), CollectionRecord::kMostRows);
  EXPECT_EQ(record->account().rowsLeftOut, 2U);
}

TEST_F(CollectionRecordTest, FlagsThatAStepNeedsAreNamed) {
  EXPECT_EQ(flagsNotSet(0x20), "flag 0x20 is not set");
  EXPECT_EQ(flagsNotSet(0x3), "flag 0x1 or 0x2 is not set");
}

}  // namespace
}  // namespace zal
