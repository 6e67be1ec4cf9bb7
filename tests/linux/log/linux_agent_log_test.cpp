#include "platform/linux/log/linux_agent_log.h"

#include <fcntl.h>
#include <unistd.h>

#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::RecordingLogFacility;

class LinuxAgentLogTest : public ::testing::Test {
 protected:
  LinuxAgentLogTest() { descriptor = ::open(output.c_str(), O_CREAT | O_WRONLY | O_APPEND, 0600); }
  ~LinuxAgentLogTest() override { ::close(descriptor); }
  std::unique_ptr<LinuxAgentLog> make(bool forJournal = false) {
    auto log = std::make_unique<LinuxAgentLog>(
        loop, LinuxAgentLog::Options{{"IPC", "Ping"}, forJournal, descriptor});
    log->setLogFacility(&facility);
    return log;
  }
  [[nodiscard]] std::string printed() const { return testing::readFile(output); }
  static RecordingLogFacility::Kept kept(int level, const std::string& line) {
    return {level, "ZalLogging", "ZalLogging", true, line, 0};
  }

  testing::TemporaryDirectory directory;
  const std::string output = directory / "stderr";
  int descriptor = -1;
  testing::ManualRunLoop loop;
  RecordingLogFacility facility;
};

TEST_F(LinuxAgentLogTest, EachLineGoesToStandardErrorAndIntoTheLogSet) {
  const auto log = make();
  log->warning("disk is slow");
  log->notice("started");
  log->log("IPC", "peer came");
  EXPECT_EQ(
      printed(),
      "zalloggingagent: warning: disk is slow\nzalloggingagent: started\nzalloggingagent: IPC: peer came\n");
  EXPECT_THAT(facility.records,
              ElementsAre(kept(4, "warning: disk is slow"), kept(5, "started"), kept(6, "IPC: peer came")));
}

TEST_F(LinuxAgentLogTest, LinesOfACategoryThatIsOffAreDropped) {
  const auto log = make();
  log->log("Automation", "hidden");
  EXPECT_TRUE(log->isEnabled("Ping"));
  EXPECT_FALSE(log->isEnabled("Pin"));
  EXPECT_EQ(printed(), "");
  EXPECT_THAT(facility.records, IsEmpty());
}

TEST_F(LinuxAgentLogTest, ForTheJournalEachLineCarriesItsPriority) {
  const auto log = make(true);
  log->warning("one\ntwo");
  log->notice("three");
  log->console("Media", "four");
  EXPECT_EQ(printed(), "<4>one\n<4>    | two\n<5>three\n<6>Media: four\n");
}

TEST_F(LinuxAgentLogTest, TheConsoleIsStandardErrorAlone) {
  const auto log = make();
  log->console("Media", "echo");
  log->console("", "bare");
  EXPECT_EQ(printed(), "zalloggingagent: Media: echo\nzalloggingagent: bare\n");
  EXPECT_THAT(facility.records, IsEmpty());
}

TEST_F(LinuxAgentLogTest, NoTextForgesALineOrReachesTheTerminalRaw) {
  const auto log = make();
  log->console("a\nzalloggingagent: warning: b", "c\x1b[2J\nzalloggingagent: warning: d");
  EXPECT_EQ(printed(),
            "zalloggingagent: a\n    | zalloggingagent: warning: b: c\\x1b[2J\n"
            "    | zalloggingagent: warning: d\n");
}

TEST_F(LinuxAgentLogTest, OtherThreadsSpeakThroughTheLoop) {
  const auto log = make();
  std::thread([&] { log->warning("from afar"); }).join();
  EXPECT_EQ(printed(), "zalloggingagent: warning: from afar\n");
  EXPECT_THAT(facility.records, IsEmpty());
  loop.drain();
  EXPECT_THAT(facility.records, ElementsAre(kept(4, "warning: from afar")));
}

TEST_F(LinuxAgentLogTest, LinesOfManyThreadsStayWhole) {
  const auto log = make();
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      for (int j = 0; j < 250; ++j) log->warning("one line");
    });
  }
  for (std::thread& thread : threads) thread.join();
  std::string expected;
  for (int i = 0; i < 1000; ++i) expected += "zalloggingagent: warning: one line\n";
  EXPECT_TRUE(printed() == expected);
  loop.drain();
  EXPECT_EQ(facility.records.size(), 1000U);
}

TEST_F(LinuxAgentLogTest, WhatIsSaidBeforeThereIsAFacilityIsKeptForIt) {
  LinuxAgentLog log(loop, {{}, false, descriptor});
  for (int i = 0; i < 101; ++i) log.notice(std::to_string(i));
  log.setLogFacility(&facility);
  ASSERT_EQ(facility.records.size(), 100U);
  EXPECT_EQ(facility.records.front(), kept(5, "0"));
  EXPECT_EQ(facility.records.back(), kept(5, "99"));
}

TEST_F(LinuxAgentLogTest, AFacilityThatComplainsAboutALineIsHeardOnStandardError) {
  class Complaining : public PlatformLogFacility {
   public:
    LinuxAgentLog* log = nullptr;
    int records = 0;
    void record(const LogRecord& /*record*/) override {
      ++records;
      log->warning("it hurts");
    }
    void flush() override {}
  } complaining;
  LinuxAgentLog log(loop, {{}, false, descriptor});
  complaining.log = &log;
  log.setLogFacility(&complaining);
  log.notice("press here");
  EXPECT_EQ(complaining.records, 1);
  EXPECT_EQ(printed(), "zalloggingagent: press here\nzalloggingagent: warning: it hurts\n");
}

TEST_F(LinuxAgentLogTest, ABacktraceIsAWarningOfSeveralLines) {
  const auto log = make();
  log->backtrace();
  ASSERT_EQ(facility.records.size(), 1U);
  EXPECT_EQ(facility.records[0].level, 4);
  EXPECT_TRUE(facility.records[0].line.starts_with("warning: backtrace:\n"));
  EXPECT_NE(facility.records[0].line.find("linux_log_tests"), std::string::npos) << facility.records[0].line;
}

TEST_F(LinuxAgentLogTest, AClosedStandardErrorIsBorne) {
  LinuxAgentLog log(loop, {{}, false, -1});
  log.setLogFacility(&facility);
  log.notice("still recorded");
  EXPECT_THAT(facility.records, ElementsAre(kept(5, "still recorded")));
}

}  // namespace
}  // namespace zal
