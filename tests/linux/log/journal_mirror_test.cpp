#include "platform/linux/log/journal_mirror.h"

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/linux/log/mirroring_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using namespace std::string_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::ListeningJournal;
using ::testing::Pair;
using testing::readFile;

class JournalMirrorTest : public testing::MirroringFixture {};

constexpr const char* kGoneLine =
    "zalloggingagent: warning: the journal is gone; records go into their files alone\n";
constexpr const char* kStalledLine =
    "zalloggingagent: warning: the journal takes nothing; records go into their files alone\n";
TEST_F(JournalMirrorTest, ARecordGoesIntoItsFileAndWithItsFieldsToTheJournal) {
  const auto journal = listen();
  mirroring->record({6, "Set", "Set-Event", false, "[a:b] one\ntwo", 7});
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
  mirroring->flush();
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
  EXPECT_THAT(journal->messages(), ElementsAre("6", "warning: " + missedText(4)));
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
  EXPECT_EQ(messages.back(), "warning: " + missedText(missed));
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
  EXPECT_THAT(journal->messages(), ElementsAre("2001", "warning: " + missedText(2000 - taken)));
}

TEST_F(JournalMirrorTest, TheEndOfTheProcessSaysWhatTheJournalDidNotTake) {
  const auto journal = listen();
  burst(2000);
  mirroring->flush();
  const int missed = 2000 - static_cast<int>(journal->messages().size());
  EXPECT_EQ(said(), missedLine(missed));
  mirroring->flush();
  EXPECT_EQ(said(), missedLine(missed));
  EXPECT_THAT(journal->messages(), IsEmpty());
  EXPECT_EQ(readFile(root + "/ZalLogging/ZalLogging.log").empty(), false);
}

TEST_F(JournalMirrorTest, WhatIsSaidAtTheEndReachesAJournalThatReads) {
  auto journal = listen();
  burst(1);
  journal->die();
  burst(3);
  journal.reset();
  journal = listen();
  wait(1s);
  burst(1);
  mirroring->flush();
  EXPECT_THAT(journal->messages(), ElementsAre("5", "warning: " + missedText(3)));
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
