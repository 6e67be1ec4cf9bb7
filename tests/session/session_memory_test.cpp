#include <gmock/gmock.h>

#include <cmath>

#include <filesystem>
#include <limits>
#include <random>

#include "session/session_writings.h"
#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr double kInfinity = std::numeric_limits<double>::infinity();

class SessionMemoryTest : public SessionFixture {
 protected:
  MemoryLedger memory{{.session = 3000, .peer = 6000, .total = 9000}};
  SessionWritings writings{fakes.host, fakes.queues};

  /// A session beside this one that keeps everything in memory.
  std::shared_ptr<ZalLoggingAgentVistelSession> unbounded =
      std::make_shared<ZalLoggingAgentVistelSession>("Vistel", unboundedBase(), services);

  SessionMemoryTest() {
    bounded.memory = &memory;
    bounded.spillFiles = &fakes.spillFiles;
    bounded.queues = &fakes.queues;
    bounded.writings = &writings;
    session = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", base, bounded);
  }
  ~SessionMemoryTest() override { session.reset(); }  // it leaves the ledger
  std::string unboundedBase() const { return fakes.home / "Unbounded"; }

  void both(const std::function<void(ZalLoggingAgentVistelSession&)>& entry) const {
    entry(*session);
    entry(*unbounded);
  }
  double anyTime() {
    constexpr double kTimes[] = {kNow, kNow, kNow + 1, 0.0, -0.0, -5, kInfinity, -kInfinity};
    switch (random() % 8) {
      case 0:
        return std::nan("");
      case 1:
        return kTimes[random() % std::size(kTimes)];
      case 2:
        return kNow - static_cast<double>(random() % 1000);
      default:
        return kNow + 0.25 * static_cast<double>(++arrivals / 3);
    }
  }
  void takeAnyEntry() {
    static const std::string kTexts[] = {"", "plain", "längst", "日本", std::string(700, 'x'), "two\nlines"};
    const std::string text = kTexts[random() % std::size(kTexts)] + std::to_string(arrivals);
    const double time = anyTime();
    switch (random() % 5) {
      case 0:
        return both([&](auto& one) { one.noteCheckpoint(text, time, "caller"); });
      case 1:
        return both([&](auto& one) { one.logQualityCategory(text, "log", "media"); });
      case 2:
        return both([&](auto& one) { one.logQualityMetric("rtt", time > 0 ? 1.5 : 2.5, "media"); });
      default:
        return both([&](auto& one) { one.logDescription(text, "log", "media", time); });
    }
  }
  /// Entries that are many times the limit; the jobs of the queues run now and then, or not at all.
  void runLargeSession(bool runsJobs) {
    both([](auto& one) {
      one.setInitiator("älice");
      one.beginSessionWithSender("caller");
    });
    for (int entry = 0; entry < 800; ++entry) {
      takeAnyEntry();
      if (runsJobs && random() % 16 == 0) fakes.queues.runAll();
    }
    both([](auto& one) { one.endSessionWithSender("caller"); });
  }
  static std::string filesIn(const std::string& directory) {
    std::string all;
    for (const std::string name : {"Log", "Verbose Log", "Quality Log"}) {
      all += readFile(directory + "/2024-05-02 at 14-03-07 (CEST) (Receiver)/" + name + " (14-03-07).log");
      all += "\n--\n";
    }
    return all;
  }

  SessionServices bounded = services;
  std::mt19937 random{7};
  int arrivals = 0;
};

TEST_F(SessionMemoryTest, WhatLeavesMemoryIsWrittenAsIfItHadStayed) {
  for (const bool runsJobs : {true, false}) {
    SCOPED_TRACE(runsJobs);
    runLargeSession(runsJobs);
    fakes.queues.runAll();
    ASSERT_TRUE(filesIn(base) == filesIn(unboundedBase()));
    EXPECT_GT(filesIn(base).size(), 100'000U);
  }
  EXPECT_GT(fakes.spillFiles.spilled, 100'000U);
  EXPECT_EQ(memory.total(), 0U);
}

TEST_F(SessionMemoryTest, HoldsNoMoreThanItsLimitOnceTheDiskHasTheRest) {
  session->beginSessionWithSender("caller");
  for (int entry = 0; entry < 1000; ++entry) {
    session->logDescription("Codec", std::string(100, 'c'), "media", kNow);
    fakes.queues.runAll();
    ASSERT_LE(memory.total(), 3000U);
  }
}

TEST_F(SessionMemoryTest, AnOrdinarySessionNeedsNoDiskBeforeItsEnd) {
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  session->endSessionWithSender("caller");
  fakes.queues.runAll();
  EXPECT_EQ(fakes.spillFiles.made, 0);
  EXPECT_THAT(verboseLog(), HasSubstr("Begin Session"));
  EXPECT_EQ(memory.total(), 0U);
}

TEST_F(SessionMemoryTest, LinesThatTheDiskRefusesStayInMemoryAndOneLineSaysSo) {
  fakes.spillFiles.refusesWrites = true;
  runLargeSession(true);
  fakes.queues.runAll();
  EXPECT_TRUE(filesIn(base) == filesIn(unboundedBase()));
  EXPECT_EQ(std::count(fakes.agentLog.lines.begin(), fakes.agentLog.lines.end(),
                       "warning: Lines of a session stay in memory, over the limit: the fake medium refuses"),
            3);  // one a log
  EXPECT_EQ(fakes.spillFiles.spilled, 0U);
}

TEST_F(SessionMemoryTest, GoesOnToTheDiskWhenThatTakesThemAgain) {
  fakes.spillFiles.refusesWrites = true;
  both([](auto& one) { one.beginSessionWithSender("caller"); });
  for (int entry = 0; entry < 200; ++entry) {
    takeAnyEntry();
    fakes.queues.runAll();
  }
  EXPECT_GT(memory.total(), 9000U);
  fakes.spillFiles.refusesWrites = false;
  for (int entry = 0; entry < 200; ++entry) {
    takeAnyEntry();
    fakes.queues.runAll();
  }
  EXPECT_LT(memory.total(), 9000U);
  both([](auto& one) { one.endSessionWithSender("caller"); });
  fakes.queues.runAll();
  EXPECT_TRUE(filesIn(base) == filesIn(unboundedBase()));
}

TEST_F(SessionMemoryTest, ARecordStaysWhenItsLinesCannotBeReadAgain) {
  bounded.sessionRecords = &fakes.sessionRecords;
  session = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", base, bounded);
  runLargeSession(true);
  fakes.spillFiles.refusesReads = true;
  fakes.queues.runAll();
  session.reset();
  EXPECT_FALSE(fakes.sessionRecords.records.at(0)->isRemoved);
  EXPECT_THAT(fakes.agentLog.lines, Contains(HasSubstr("were lost")));
}

TEST_F(SessionMemoryTest, WhatFollowsTheFilesOfALargeSessionWaitsForThem) {
  writeFile(fakes.home / "capture", "captured");
  session->beginSessionWithSender("caller");
  session->addLogFile(fakes.home / "capture", "caller", "");
  for (int entry = 0; entry < 100; ++entry) session->logDescription("Codec", "chosen", "media", kNow);
  session->endSessionWithSender("caller");
  EXPECT_THAT(collections, IsEmpty());
  EXPECT_FALSE(std::filesystem::exists(receiverDirectory + "/capture"));
  // It goes on as another one meanwhile.
  session->beginSessionWithSender("caller");
  fakes.queues.runAll();
  ASSERT_EQ(collections.size(), 1U);
  EXPECT_EQ(collections[0].destination, std::filesystem::canonical(receiverDirectory));
  EXPECT_TRUE(std::filesystem::exists(receiverDirectory + "/capture"));
  EXPECT_THAT(verboseLog(), HasSubstr("End Session"));
}

TEST_F(SessionMemoryTest, TheEndOfTheProcessWaitsForTheFilesOfLargeSessions) {
  session->beginSessionWithSender("caller");
  for (int entry = 0; entry < 100; ++entry) session->logDescription("Codec", "chosen", "media", kNow);
  session->endSessionWithSender("caller");
  writings.finishAll();
  EXPECT_EQ(collections.size(), 1U);
  EXPECT_THAT(verboseLog(), HasSubstr("End Session"));
  fakes.queues.runAll();
  EXPECT_EQ(collections.size(), 1U);
}

}  // namespace
}  // namespace zal::testing
