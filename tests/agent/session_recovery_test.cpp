#include "agent/session_recovery.h"

#include <gmock/gmock.h>

#include "session/entry_codec.h"
#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;
using ::testing::StartsWith;

/// Sessions that a server was cut off in. It is 14:03:07.251 on 2024-05-02 in CEST.
class SessionRecoveryTest : public testing::AgentFixture {
 protected:
  void beginAndLeave(const std::string& type) {
    server->beginSession(type, "caller", 0, 7);
    server->noteCheckpoint("Connected", type, 1714651388.0, "caller");
  }
  void recover() { recoverSessions(fake.platform, sessions.services()); }
  [[nodiscard]] testing::FakeSessionRecords::Kept& record(std::size_t number) const {
    return *fake.sessionRecords.records.at(number);
  }
  [[nodiscard]] std::string logOf(const std::string& type, const std::string& name = "Log") {
    return report(type + "/2024-05-02 at 14-03-07 (CEST) (Receiver)/" + name + " (14-03-07).log");
  }
};

TEST_F(SessionRecoveryTest, EverySessionThatWasCutOffGetsItsFilesWithALineThatSaysSo) {
  createLogging();
  beginAndLeave("Vistel");
  beginAndLeave("a/Nexa");
  recover();
  const std::string line = "[Recovered: the agent was cut off after 14:03:07.251  (2024-05-02) (CEST)]\n";
  for (const char* name : {"Log", "Verbose Log", "Quality Log"}) {
    EXPECT_THAT(logOf("Vistel", name), StartsWith(line));
    EXPECT_THAT(logOf("Nexa", name), StartsWith(line));
  }
  EXPECT_THAT(logOf("Vistel"), HasSubstr("[Sender: caller] Connected"));
  EXPECT_TRUE(record(0).isRemoved && record(1).isRemoved);
}

TEST_F(SessionRecoveryTest, NothingIsCollectedForIt) {
  createLogging();
  beginAndLeave("Vistel");
  recover();
  EXPECT_THAT(calls, Not(Contains(StartsWith("CollectServiceLogs"))));
  EXPECT_THAT(fake.sessionRecords.records, SizeIs(1));
}

TEST_F(SessionRecoveryTest, ItHappensWhateverTheSwitchesSay) {
  createLogging();
  beginAndLeave("Vistel");
  switchOff("CallLogging");
  server->readLoggingPreferences();
  recover();
  EXPECT_THAT(logOf("Vistel"), HasSubstr("Connected"));
}

TEST_F(SessionRecoveryTest, DamageIsCountedInTheLine) {
  createLogging();
  beginAndLeave("Vistel");
  record(0).unreadableBytes = 100;
  record(0).pieces.insert(record(0).pieces.begin() + 3, "of a later version");
  recover();
  EXPECT_THAT(logOf("Vistel"),
              StartsWith("[Recovered: the agent was cut off after 14:03:07.251  (2024-05-02) (CEST); "
                         "118 bytes of its record could not be read]\n"));
}

TEST_F(SessionRecoveryTest, ARecordWithoutItsTypeBecomesTheDefaultOne) {
  createLogging();
  beginAndLeave("Vistel");
  record(0).pieces.erase(record(0).pieces.begin(), record(0).pieces.begin() + 2);
  recover();
  EXPECT_THAT(logOf("Current"), HasSubstr("Connected"));
}

TEST_F(SessionRecoveryTest, ATypeThatWouldLeadElsewhereDoesNot) {
  createLogging();
  beginAndLeave("Vistel");
  for (std::string& piece : record(0).pieces) {
    if (decodeEntry(piece)->kind != SessionEntryKind::opened) continue;
    encodeEntry({.kind = SessionEntryKind::opened, .text = "../../.."}, piece);
  }
  recover();
  EXPECT_THAT(logOf("Current"), HasSubstr("Connected"));
}

TEST_F(SessionRecoveryTest, ARecordWithNothingInItGoesAndOneThatIsAllDamageIsNamed) {
  createLogging();
  fake.sessionRecords.records.push_back(std::make_shared<testing::FakeSessionRecords::Kept>());
  recover();
  EXPECT_TRUE(record(0).isRemoved);
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  fake.sessionRecords.records.push_back(std::make_shared<testing::FakeSessionRecords::Kept>());
  record(1).unreadableBytes = 3;
  recover();
  EXPECT_THAT(fake.agentLog.lines, Contains(HasSubstr("could be read from the black box")));
}

TEST_F(SessionRecoveryTest, ALongSessionTakesNoMoreMemoryThanOneThatGoesOn) {
  createLogging();
  beginAndLeave("Vistel");
  std::string piece;
  encodeEntry({.kind = SessionEntryKind::description,
               .text = std::string(120, 'x'),
               .log = "Codec",
               .sender = "media",
               .time = 1714651389},
              piece);
  record(0).pieces.insert(record(0).pieces.end(), 1000, piece);
  MemoryLedger memory{{.session = 3000, .peer = 6000, .total = 9000}};
  SessionServices services = sessions.services();
  services.memory = &memory;
  std::uint64_t most = 0;
  fake.sessionRecords.onRead = [&] { most = std::max(most, memory.total()); };
  recoverSessions(fake.platform, services);
  EXPECT_GT(most, 1000U);
  EXPECT_LE(most, 3000U);
  EXPECT_GT(fake.spillFiles.spilled, 100'000U);
  EXPECT_GT(logOf("Vistel", "Verbose Log").size(), 120'000U);
  EXPECT_TRUE(record(0).isRemoved);
}

}  // namespace
}  // namespace zal
