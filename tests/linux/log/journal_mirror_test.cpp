#include "platform/linux/log/journal_mirror.h"

#include <fcntl.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/log/file_log_facility.h"
#include "platform/linux/log/linux_agent_log.h"
#include "platform/linux/log/mirroring_log_facility.h"
#include "platform/linux/log/record_text.h"
#include "tests/linux/log/listening_journal.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::ListeningJournal;
using ::testing::Pair;
using testing::readFile;

/// The whole way: the agent's own log speaks into the facility that it is about.
class JournalMirrorTest : public ::testing::Test {
 protected:
  JournalMirrorTest() { agentLog.setLogFacility(&facility); }
  ~JournalMirrorTest() override { agentLog.setLogFacility(nullptr); }
  void record(const std::string& line) { facility.record({6, "Set", "Set", false, line, 0}); }
  /// One turn of the loop with so many records, named by their numbers.
  void burst(int count) {
    for (int i = 0; i < count; ++i) record(std::to_string(++_last));
    loop.drain();
  }
  void wait(std::chrono::nanoseconds time) {
    // In steps, as a loop would sleep: sending is what it does before.
    for (; time > 0ns; time -= 10ms) {
      loop.advance(10ms);
      loop.drain();
    }
  }
  /// How many records the files have.
  [[nodiscard]] std::size_t kept() const { return countRecords(readFile(root + "/Set/Set.log")); }
  /// What the agent has said, without times.
  [[nodiscard]] std::string said() const { return readFile(directory / "stderr"); }
  std::unique_ptr<ListeningJournal> listen() { return std::make_unique<ListeningJournal>(path); }

  testing::TemporaryDirectory directory;
  const std::string root = directory / "Logs";
  const std::string path = directory / "journal";
  const Descriptor errors{::open((directory / "stderr").c_str(), O_CREAT | O_WRONLY | O_APPEND, 0600)};
  testing::ManualRunLoop loop;
  testing::ManualWorkQueues queues{loop};
  LinuxAgentLog agentLog{loop, {{}, false, errors.get()}};
  FileLogFacility files{{loop, loop, queues, agentLog}, root, LogSettings()};
  MirroringLogFacility facility{files, {loop, loop, agentLog}, path};

 private:
  int _last = 0;
};

constexpr const char* kGoneLine =
    "zalloggingagent: warning: the journal is gone; records go into their files alone\n";
constexpr const char* kStalledLine =
    "zalloggingagent: warning: the journal takes nothing; records go into their files alone\n";
std::string missedLine(int count) {
  return "zalloggingagent: warning: " + std::to_string(count) +
         " records are in their files but not in the journal\n";
}

TEST_F(JournalMirrorTest, ARecordGoesIntoItsFileAndWithItsFieldsToTheJournal) {
  const auto journal = listen();
  facility.record({6, "Set", "Set-Event", false, "[a:b] one\ntwo", 7});
  EXPECT_THAT(journal->entries(), IsEmpty());
  loop.drain();
  EXPECT_THAT(journal->entries(),
              ElementsAre(ElementsAre(Pair("PRIORITY", "6"), Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                                      Pair("ZAL_TIME", "7"), Pair("ZAL_TYPE", "Set"),
                                      Pair("ZAL_CATEGORY", "Set-Event"), Pair("MESSAGE", "[a:b] one\ntwo"))));
  EXPECT_EQ(readFile(root + "/Set/Set-Event.log"), "2024-05-02 14:03:07.251 <6> t=7 [a:b] one\n    | two\n");
}

TEST_F(JournalMirrorTest, HostileTextsArriveAsTheyCame) {
  const auto journal = listen();
  const std::vector<std::string> texts = {"\nPRIORITY=0\n", "a\0b"s, "\xff\x80", "x\nMESSAGE\n"};
  for (const std::string& text : texts) {
    record(text);
    loop.drain();
  }
  EXPECT_EQ(journal->messages(), texts);
}

TEST_F(JournalMirrorTest, TheAgentsOwnLinesAreThereWithTheirPriority) {
  const auto journal = listen();
  agentLog.warning("disk is slow");
  loop.drain();
  EXPECT_THAT(
      journal->entries(),
      ElementsAre(ElementsAre(Pair("PRIORITY", "4"), Pair("SYSLOG_IDENTIFIER", "zalloggingagent"),
                              Pair("SYSLOG_PID", std::to_string(::getpid())), Pair("ZAL_TYPE", "ZalLogging"),
                              Pair("ZAL_CATEGORY", "ZalLogging"), Pair("MESSAGE", "warning: disk is slow"))));
}

TEST_F(JournalMirrorTest, AHugeRecordGoesInSealedMemoryBetweenTheOthers) {
  const auto journal = listen();
  const std::string huge(3'000'000, 'x');
  record("before");
  record(huge);
  record("after");
  loop.drain();
  EXPECT_EQ(journal->messages(), (std::vector<std::string>{"before", huge, "after"}));
  EXPECT_EQ(journal->sealed, 1);
}

TEST_F(JournalMirrorTest, TheLargestDatagramAndTheSmallestSealedRecordBothArrive) {
  const auto journal = listen();
  for (const std::size_t size : {65'000U, 65'273U, 65'274U, 65'275U, 65'536U, 66'000U}) {
    record(std::string(size, 'x'));
    loop.drain();
    EXPECT_THAT(journal->messages(), ElementsAre(std::string(size, 'x'))) << size;
  }
  // 65,536 less 256 and less the type and the category.
  EXPECT_EQ(journal->sealed, 3);
}

TEST_F(JournalMirrorTest, WithoutAJournalNothingIsSaidAndNothingWaits) {
  burst(1000);
  EXPECT_EQ(kept(), 1000U);
  EXPECT_EQ(loop.pendingTimers(), 0U);
  facility.flush();
  EXPECT_EQ(said(), "");
}

TEST_F(JournalMirrorTest, AJournalThatComesLaterIsLookedForOnceASecond) {
  burst(1);
  const auto journal = listen();
  loop.advance(999ms);
  burst(1);
  EXPECT_THAT(journal->messages(), IsEmpty());
  loop.advance(1ms);
  burst(2);
  EXPECT_THAT(journal->messages(), ElementsAre("3", "4"));
  EXPECT_EQ(said(), "");
}

TEST_F(JournalMirrorTest, AJournalThatWasRestartedGetsEvenTheFirstRecord) {
  auto journal = listen();
  burst(1);
  journal.reset();
  journal = listen();
  burst(1);
  EXPECT_THAT(journal->messages(), ElementsAre("2"));
  EXPECT_EQ(said(), "");
}

TEST_F(JournalMirrorTest, AJournalThatIsAwayForAWhileIsSaidOnceWithTheCountAtTheEnd) {
  auto journal = listen();
  burst(1);
  journal->die();
  burst(3);
  wait(5s);
  burst(1);
  wait(10ms);
  EXPECT_EQ(said(), kGoneLine);
  journal.reset();
  journal = listen();
  wait(1s);
  burst(1);
  wait(2s);
  EXPECT_EQ(said(), kGoneLine + missedLine(4));
  EXPECT_THAT(journal->messages(),
              ElementsAre("6", "warning: 4 records are in their files but not in the journal"));
  EXPECT_EQ(kept(), 6U);
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(JournalMirrorTest, ABurstThatTheSocketDoesNotHoldFollowsALittleLater) {
  const auto journal = listen();
  burst(900);  // far more than a socket holds at once
  std::vector<std::string> messages;
  for (int round = 0; round < 200 && messages.size() < 900; ++round) {
    for (std::string& message : journal->messages()) messages.push_back(std::move(message));
    wait(10ms);
  }
  ASSERT_EQ(messages.size(), 900U);
  EXPECT_EQ(messages.front(), "1");
  EXPECT_EQ(messages.back(), "900");
  EXPECT_EQ(said(), "");
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(JournalMirrorTest, WhatDoesNotFitIsCountedAndSaidOnceAfterTheFlood) {
  const auto journal = listen();
  burst(20'000);
  EXPECT_EQ(kept(), 20'000U);
  std::vector<std::string> messages;
  for (int round = 0; round < 400; ++round) {
    for (std::string& message : journal->messages()) messages.push_back(std::move(message));
    wait(10ms);
  }
  const int missed = 20'000 - static_cast<int>(messages.size() - 1);
  EXPECT_GT(missed, 10'000);
  EXPECT_EQ(said(), missedLine(missed));
  EXPECT_EQ(messages.back(),
            "warning: " + std::to_string(missed) + " records are in their files but not in the journal");
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(JournalMirrorTest, AJournalThatNobodyReadsIsGivenUpAfterASecond) {
  const auto journal = listen();
  burst(2000);
  wait(990ms);
  EXPECT_EQ(said(), "");
  wait(20ms);
  EXPECT_EQ(said(), kStalledLine);
  EXPECT_EQ(loop.pendingTimers(), 0U);
  for (int second = 0; second < 5; ++second) {
    burst(10);
    wait(1s);
  }
  EXPECT_EQ(said(), kStalledLine);
  EXPECT_EQ(kept(), 2050U);
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(JournalMirrorTest, AJournalThatReadsAgainGetsWhatComesThenAndTheCount) {
  const auto journal = listen();
  burst(2000);
  wait(1100ms);
  const auto taken = static_cast<int>(journal->messages().size());
  wait(1s);
  burst(1);
  wait(2s);
  EXPECT_EQ(said(), kStalledLine + missedLine(2000 - taken));
  EXPECT_THAT(journal->messages(), ElementsAre("2001", "warning: " + std::to_string(2000 - taken) +
                                                           " records are in their files but not in the "
                                                           "journal"));
}

TEST_F(JournalMirrorTest, TheEndOfTheProcessSaysWhatTheJournalDidNotTake) {
  const auto journal = listen();
  burst(2000);
  facility.flush();
  EXPECT_EQ(said(), missedLine(2000 - static_cast<int>(journal->messages().size())));
  EXPECT_EQ(readFile(root + "/ZalLogging/ZalLogging.log").empty(), false);
}

TEST_F(JournalMirrorTest, NoMoreThanAThousandRecordsGoInATenthOfASecond) {
  const auto journal = listen();
  std::size_t count = 0;
  for (int turn = 0; turn < 150; ++turn) {
    burst(10);
    count += journal->messages().size();
  }
  EXPECT_EQ(count, 1000U);
  wait(90ms);
  EXPECT_THAT(journal->messages(), IsEmpty());
  wait(10ms);
  EXPECT_FALSE(journal->messages().empty());
}

TEST_F(JournalMirrorTest, APathThatIsNoSocketIsNoJournal) {
  testing::writeFile(path, "text");
  burst(1);
  EXPECT_EQ(said(), "");
  EXPECT_EQ(kept(), 1U);
}

}  // namespace
}  // namespace zal
