#include <gmock/gmock.h>

#include <fstream>

#include "session/entry_codec.h"
#include "tests/session/session_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::StartsWith;

/// Sessions that are recorded, and others that take their records.
class SessionReplayTest : public testing::SessionFixture {
 protected:
  SessionReplayTest() {
    services.sessionRecords = &fakes.sessionRecords;
    session = makeSession();
  }
  [[nodiscard]] std::vector<SessionEntry> entriesOf(std::size_t record) const {
    std::vector<SessionEntry> entries;
    for (const std::string& piece : fakes.sessionRecords.records.at(record)->pieces) {
      entries.push_back(decodeEntry(piece).value());
    }
    return entries;
  }
  [[nodiscard]] std::vector<SessionEntryKind> kindsOf(std::size_t record) const {
    std::vector<SessionEntryKind> kinds;
    for (const SessionEntry& entry : entriesOf(record)) kinds.push_back(entry.kind);
    return kinds;
  }
  [[nodiscard]] bool isRemoved(std::size_t record) const {
    return fakes.sessionRecords.records.at(record)->isRemoved;
  }
  /// Takes the record as a later process does. Returned: whether it was written.
  bool replay(std::size_t record) {
    SessionServices others = services;
    others.sessionRecords = nullptr;
    const auto later = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", base, others);
    later->setRecoveryNote("a note");
    const auto entries = entriesOf(record);
    for (const SessionEntry& entry : entries) later->replay(entry);
    return later->endReplay(entries.back().at);
  }
  /// One of everything, with time between them.
  void reportACall() {
    const auto pass = [&] { host.advance(1001ms); };
    session->beginSessionWithSender("caller");
    session->setIsInitiator(true);
    pass();
    session->setInitiator("ann");
    session->setRecipient("bob");
    session->setFailureReason("first reason");
    session->setFailureReason("lost");
    session->noteCheckpoint("Late", kNow + 7, "caller");
    session->noteCheckpoint("Early", kNow - 7, std::nullopt);
    session->logDescription("Offer", "v=0\nm=audio", "caller", kNow + 1);
    session->logDescription("caf\xC3\xA9", std::nullopt, "", kNow + 1);
    pass();
    session->logQualityCategory("Video", "fair", "media");
    session->logQualityMetric("rtt", 20.5, "media");
    pass();
    session->logQualityMetric("rtt", std::int64_t{21}, std::nullopt);
    session->logCallInfo("opus", "Codec", "caller");
    pass();
    host.advance(5s);  // and a sample
    testing::writeFile(fakes.home / "tmp/trace.txt", "a trace");
    session->addLogFile(fakes.home / "tmp/trace.txt", "caller", "Traces");
  }
  std::string initiatorDirectory = base + "/2024-05-02 at 14-03-07 (CEST) (Initiator)";
  [[nodiscard]] std::vector<std::string> threeLogs() const {
    return {testing::readFile(initiatorDirectory + "/Log (14-03-07).log"),
            testing::readFile(initiatorDirectory + "/Verbose Log (14-03-07).log"),
            testing::readFile(initiatorDirectory + "/Quality Log (14-03-07).log")};
  }
  /// Without the header line of a recovery.
  static std::string withoutNote(const std::string& text) {
    const std::string line = "[Recovered: a note]\n";
    EXPECT_THAT(text, StartsWith(line));
    return text.substr(line.size());
  }
};

TEST_F(SessionReplayTest, AReplayWritesTheSameBytesAsTheSessionItselfButForTheNote) {
  reportACall();
  session->endSessionWithSender("caller");
  const auto written = threeLogs();
  ASSERT_THAT(written, Each(HasSubstr("End Session")));
  EXPECT_TRUE(isRemoved(0));
  EXPECT_EQ(std::filesystem::canonical(fakes.sessionRecords.records[0]->writtenInto),
            std::filesystem::canonical(initiatorDirectory));
  std::filesystem::remove_all(base);
  testing::writeFile(fakes.home / "tmp/trace.txt", "a trace");

  host.advance(24h);
  EXPECT_TRUE(replay(0));
  const auto recovered = threeLogs();
  for (int log = 0; log < 3; ++log) EXPECT_EQ(withoutNote(recovered[log]), written[log]);
  EXPECT_EQ(testing::readFile(initiatorDirectory + "/Traces/trace.txt"), "a trace");
}

TEST_F(SessionReplayTest, ACutOffSessionIsEndedAtItsLastEntry) {
  reportACall();
  EXPECT_FALSE(isRemoved(0));
  EXPECT_TRUE(replay(0));
  EXPECT_THAT(threeLogs(),
              Each(HasSubstr("[Sender: RECOVERED] End Session  [14:03:16.255  (2024-05-02) (CEST)]\n")));
}

TEST_F(SessionReplayTest, ACutOffSessionIsWrittenHoweverShortItIs) {
  session->beginSessionWithSender("caller");
  session->noteCheckpoint("Connected", kNow, "caller");
  EXPECT_TRUE(replay(0));
  EXPECT_THAT(simpleLog(), HasSubstr("Connected"));
}

TEST_F(SessionReplayTest, ASessionThatEndedTooShortIsNotWrittenByItsReplayEither) {
  session->beginSessionWithSender("caller");
  session->noteCheckpoint("Connected", kNow, "caller");
  session->endSessionWithSender("caller");
  EXPECT_FALSE(isRemoved(0));
  EXPECT_TRUE(replay(0));
  EXPECT_FALSE(std::filesystem::exists(base));
  session.reset();
  EXPECT_TRUE(isRemoved(0));
}

TEST_F(SessionReplayTest, WhatAnUnwrittenSessionLeavesInTheListsIsInTheRecordToo) {
  session->beginSessionWithSender("first");
  session->endSessionWithSender("first");
  session->beginSessionWithSender("second");
  session->noteCheckpoint("Connected", kNow, "second");
  EXPECT_TRUE(replay(0));
  EXPECT_THAT(simpleLog(), HasSubstr("[Sender: first] Begin Session"));
  EXPECT_THAT(fakes.sessionRecords.records, SizeIs(1));
}

TEST_F(SessionReplayTest, TheNextSessionOfAnObjectRecordsWhatItStillHas) {
  reportACall();
  session->endSessionWithSender("caller");
  host.advance(60s);
  session->noteCheckpoint("Again", kNow + 60, "caller");
  session->logQualityMetric("rtt", 30.5, "media");
  ASSERT_THAT(fakes.sessionRecords.records, SizeIs(2));
  EXPECT_TRUE(replay(1));
  const auto replayed = testing::listTree(base);
  std::vector<std::string> recovered;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(base)) {
    if (entry.path().filename() == "Quality Log (14-04-16).log" ||
        entry.path().filename() == "Log (14-04-16).log") {
      recovered.push_back(withoutNote(testing::readFile(entry.path())));
      std::filesystem::remove(entry.path());
    }
  }
  ASSERT_THAT(recovered, SizeIs(2)) << replayed;
  session->endSessionWithSender("RECOVERED");
  for (const auto& entry : std::filesystem::recursive_directory_iterator(base)) {
    if (entry.path().filename() == "Quality Log (14-04-16).log" ||
        entry.path().filename() == "Log (14-04-16).log") {
      EXPECT_THAT(recovered, ::testing::Contains(testing::readFile(entry.path())));
    }
  }
  EXPECT_TRUE(isRemoved(1));
}

TEST_F(SessionReplayTest, ARecordSaysWhoseItIsTwice) {
  session->beginSessionWithSender("caller");
  EXPECT_THAT(kindsOf(0),
              ElementsAre(SessionEntryKind::opened, SessionEntryKind::opened, SessionEntryKind::begin));
  EXPECT_EQ(entriesOf(0)[0].text, "Vistel");
}

TEST_F(SessionReplayTest, AnEndWithoutASessionOpensNoRecord) {
  session->endSessionWithSender("caller");
  EXPECT_THAT(fakes.sessionRecords.records, IsEmpty());
}

TEST_F(SessionReplayTest, AnAbandonedActiveSessionLeavesItsRecord) {
  session->beginSessionWithSender("caller");
  session.reset();
  EXPECT_FALSE(isRemoved(0));
}

TEST_F(SessionReplayTest, ASessionWhoseFilesTheDiskRefusesLeavesItsRecord) {
  testing::writeFile(base, "in the way");
  session->beginSessionWithSender("caller");
  noteCheckpoints(3);
  session->endSessionWithSender("caller");
  session.reset();
  EXPECT_FALSE(isRemoved(0));
  EXPECT_FALSE(replay(0));
  std::filesystem::remove(base);
  EXPECT_TRUE(replay(0));
  EXPECT_THAT(simpleLog(), HasSubstr("[Sender: caller] End Session"));
}

TEST_F(SessionReplayTest, WithoutABlackBoxASessionWorksAsEver) {
  fakes.sessionRecords.isEnabled = false;
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  session->endSessionWithSender("caller");
  EXPECT_THAT(simpleLog(), HasSubstr("End Session"));
}

}  // namespace
}  // namespace zal
