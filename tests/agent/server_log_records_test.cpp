#include <gmock/gmock.h>

#include "tests/agent/agent_fixture.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using Kept = testing::RecordingLogFacility::Kept;

class AgentLogRecordTest : public testing::AgentFixture {
 protected:
  void SetUp() override { create(); }
};

TEST_F(AgentLogRecordTest, ALogRecordBecomesOneLineUnderItsTypeAtLevel6) {
  server->log(
      {.text = "Z", .level = 3, .category = "Y", .sender = "X", .pid = 12, .type = "Vistel", .time = 99});
  EXPECT_THAT(fake.logFacility.records, ElementsAre(Kept{6, "Vistel", "Vistel", false, "[X:Y] Z", 99}));
}

TEST_F(AgentLogRecordTest, AnEventRecordGoesUnderTheEventCategoryOfItsType) {
  server->event(
      {.text = "Z", .level = 3, .category = "Y", .sender = "X", .pid = 12, .type = "Vistel", .time = 99});
  EXPECT_THAT(fake.logFacility.records, ElementsAre(Kept{6, "Vistel", "Vistel-Event", false, "[X:Y] Z", 99}));
}

TEST_F(AgentLogRecordTest, AnAbsentTypeIsZalLogging) {
  server->log({.text = "Z", .category = "Y", .sender = "X"});
  server->event({.text = "Z", .category = "Y", .sender = "X"});
  EXPECT_THAT(fake.logFacility.records,
              ElementsAre(Kept{6, "ZalLogging", "ZalLogging", false, "[X:Y] Z", 0},
                          Kept{6, "ZalLogging", "ZalLogging-Event", false, "[X:Y] Z", 0}));
}

TEST_F(AgentLogRecordTest, AbsentSenderAndCategoryHaveTheirWordsAndEmptyOnesStayEmpty) {
  server->log({.text = "Z"});
  server->log({.text = "Z", .category = "", .sender = "", .type = ""});
  EXPECT_THAT(fake.logFacility.records,
              ElementsAre(Kept{6, "ZalLogging", "ZalLogging", false, "[(No Sender):(No Category)] Z", 0},
                          Kept{6, "", "", false, "[:] Z", 0}));
}

TEST_F(AgentLogRecordTest, ARecordOfLevel3IsWrittenAtLevel6) {
  server->log({.text = "Z", .level = 3});
  EXPECT_EQ(fake.logFacility.records.at(0).level, 6);
}

TEST_F(AgentLogRecordTest, AnEmptyTextNeitherWritesNorEchoesNorNotesActivity) {
  switchOn("ConsoleOutputTorvik");
  server->readLoggingPreferences();
  const auto before = server->lastActivity();
  advance(1s);
  server->log({.text = ""});
  server->log({});
  server->event({.text = ""});
  server->event({});
  EXPECT_THAT(fake.logFacility.records, IsEmpty());
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
  EXPECT_EQ(server->lastActivity(), before);
}

TEST_F(AgentLogRecordTest, ARecordNotesActivity) {
  advance(1s);
  server->log({.text = "Z"});
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
  advance(1s);
  server->event({.text = "Z"});
  EXPECT_EQ(server->lastActivity(), fake.host.steadyNow());
}

TEST_F(AgentLogRecordTest, WithNoPreferencesSetRecordsAreWrittenAndNotEchoed) {
  server->log({.text = "Z", .category = "Y", .sender = "X"});
  EXPECT_EQ(fake.logFacility.records.size(), 1U);
  EXPECT_THAT(fake.agentLog.lines, IsEmpty());
}

TEST_F(AgentLogRecordTest, TheTorvikSwitchEchoesTheBareTextUnderTheRecordsCategory) {
  switchOn("ConsoleOutputTorvik");
  server->readLoggingPreferences();
  server->log({.text = "Z 100%", .category = "Y", .sender = "X"});
  server->event({.text = "W"});
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("console:Y: Z 100%", "console:(No Category): W"));
}

TEST_F(AgentLogRecordTest, TheTorvikSwitchIsReadAsItIsAtThatMoment) {
  switchOn("ConsoleOutputTorvik");
  server->log({.text = "before"});
  server->readLoggingPreferences();
  server->log({.text = "after"});
  EXPECT_THAT(fake.agentLog.lines, ElementsAre("console:(No Category): after"));
}

}  // namespace
}  // namespace zal
