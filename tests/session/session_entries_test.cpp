#include <limits>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

/// A session that began at 14:03:07.251 and that end() writes a minute later; its files without their
/// two header lines.
class SessionEntriesTest : public SessionFixture {
 protected:
  SessionEntriesTest() { session->beginSessionWithSender("caller"); }
  void end() {
    fakes.networkStatus.associated = true;  // no values: nothing is sampled
    host.advance(60s);
    session->endSessionWithSender("caller");
  }
  static std::string entriesOf(std::string file) { return file.substr(file.find("[Sender: ")); }
};

TEST_F(SessionEntriesTest, PlacesACheckpointByItsTimeInBothLogs) {
  session->noteCheckpoint("Later", kNow + 2, "Y");
  session->noteCheckpoint("Connected", kNow + 1, "X");
  end();
  EXPECT_EQ(entriesOf(simpleLog()), R"([Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: X] Connected   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: Y] Later   [14:03:09.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:07.251  (2024-05-02) (CEST)]
)");
  EXPECT_EQ(verboseLog(), simpleLog());
}

TEST_F(SessionEntriesTest, SaysWhatIsMissingOfACheckpointOrADescription) {
  session->noteCheckpoint(std::nullopt, kNow + 1, std::nullopt);
  session->noteCheckpoint("", kNow + 2, "X");
  session->noteCheckpoint("Connected", kNow + 3, "");
  session->logDescription("", std::nullopt, "", kNow + 4);
  session->logDescription("What", "", std::nullopt, kNow + 5);
  session->logDescription(std::nullopt, "log", "X", kNow + 6);
  session->logDescription("What", "log", "X", kNow + 7);
  end();
  EXPECT_EQ(entriesOf(verboseLog()), R"([Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: (No sender)] (No checkpoint provided)   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: X] (No checkpoint provided)   [14:03:09.251  (2024-05-02) (CEST)]
[Sender: (No sender)] Connected   [14:03:10.251  (2024-05-02) (CEST)]
[Sender: No Sender] ** No Log Provided **   [14:03:11.251  (2024-05-02) (CEST)]
[Sender: No Sender] What   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: X] log   [14:03:13.251  (2024-05-02) (CEST)]
[Sender: X] What: log   [14:03:14.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:07.251  (2024-05-02) (CEST)]
)");
}

TEST_F(SessionEntriesTest, KeepsDescriptionsOutOfTheSimpleLog) {
  session->logDescription("What", "log", "X", kNow + 1);
  session->logDescription("What", "log", "X", kNow + 2);
  end();
  EXPECT_EQ(entriesOf(simpleLog()), R"([Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:07.251  (2024-05-02) (CEST)]
)");
}

TEST_F(SessionEntriesTest, AppendsQualityCategoriesInOrderOfArrivalWithTheTimeOfNow) {
  session->logQualityCategory("Video", "frozen", "X");
  host.advance(1s);
  session->logQualityCategory("", "", "");
  session->logQualityMetric("rtt", Number(4.5), "");
  end();
  EXPECT_EQ(entriesOf(qualityLog()), R"([Sender: X] Video: frozen   [14:03:07.251  (2024-05-02) (CEST)]
[Sender: No Sender] ** No Log Provided **   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: No Sender] rtt: 4.5   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:08.251  (2024-05-02) (CEST)]
========================================
  [rtt]
 Average: 4.5
     Min: 4.5
     Max: 4.5
  Median: 4.5
  StdDev: 0
)");
}

TEST_F(SessionEntriesTest, KeepsTheLinesOfATextOfSeveralLines) {
  session->logDescription("Stats", "one\ntwo", "X", kNow + 1);
  session->noteCheckpoint("1", kNow + 2, "X");
  end();
  EXPECT_EQ(entriesOf(verboseLog()), R"([Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: X] Stats: one
two   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: X] 1   [14:03:09.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:07.251  (2024-05-02) (CEST)]
)");
}

TEST_F(SessionEntriesTest, SurvivesAnyTimeAClientCanSend) {
  session->noteCheckpoint("nan", std::numeric_limits<double>::quiet_NaN(), "X");
  session->noteCheckpoint("inf", std::numeric_limits<double>::infinity(), "X");
  session->noteCheckpoint("-inf", -std::numeric_limits<double>::infinity(), "X");
  end();
  EXPECT_EQ(entriesOf(simpleLog()), R"([Sender: X] -inf   [02:00:00.000  (0001-01-01) (CEST)]
[Sender: X] nan   [02:00:00.000  (1970-01-01) (CEST)]
[Sender: caller] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:04:07.251  (2024-05-02) (CEST)]
[Sender: X] inf   [01:59:59.000  (10000-01-01) (CEST)]
)");
}

/// What an entry does to a session that never began.
class SessionImplicitBeginTest : public SessionFixture {
 protected:
  /// The lines that were echoed, with all echoes on.
  Lines echoes(const std::function<void()>& entry) {
    session = makeSession();
    session->setLogCheckpointsToConsole(true);
    session->setLogDescriptionsToConsole(true);
    fakes.agentLog.lines.clear();
    entry();
    return fakes.agentLog.lines;
  }
};

TEST_F(SessionImplicitBeginTest, ADescriptionBeginsTheSessionFirst) {
  EXPECT_EQ(echoes([&] { session->logDescription("What", "log", "", kNow + 1); }),
            (Lines{"notice: === [Sender: No Sender] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]",
                   "notice: === [Sender: No Sender] What: log   [14:03:08.251  (2024-05-02) (CEST)]"}));
  EXPECT_TRUE(session->isActive());
}

TEST_F(SessionImplicitBeginTest, ACheckpointBeginsItWithTheSenderAsReceived) {
  EXPECT_EQ(echoes([&] { session->noteCheckpoint("Connected", kNow, ""); }),
            (Lines{"notice: === [Sender: ] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]",
                   "notice: === [Sender: (No sender)] Connected   [14:03:07.251  (2024-05-02) (CEST)]"}));
}

TEST_F(SessionImplicitBeginTest, EveryOtherEntryBeginsItWithNoSender) {
  const std::string begin =
      "notice: === [Sender: No Sender] Begin Session  [14:03:07.251  (2024-05-02) (CEST)]";
  EXPECT_EQ(echoes([&] { session->logQualityCategory("What", "", ""); }),
            (Lines{begin, "notice: === [Sender: No Sender] What   [14:03:07.251  (2024-05-02) (CEST)]"}));
  EXPECT_EQ(echoes([&] { session->logCallInfo("x", "y", ""); }), Lines{begin});
  EXPECT_EQ(echoes([&] { session->logQualityMetric("x", Number(1.0), std::nullopt); }), Lines{begin});
}

TEST_F(SessionImplicitBeginTest, ALogFileBeginsNothing) {
  EXPECT_EQ(echoes([&] { session->addLogFile("/x", "caller", "Video"); }), Lines{});
  EXPECT_FALSE(session->isActive());
}

TEST_F(SessionImplicitBeginTest, EntriesAreEchoedOnlyUnderTheirOwnSwitch) {
  session->beginSessionWithSender("caller");
  session->setLogCheckpointsToConsole(true);
  session->logDescription("hidden", "", "X", kNow);
  session->logQualityCategory("hidden", "", "X");
  session->noteCheckpoint("shown", kNow, "X");
  session->setLogCheckpointsToConsole(false);
  session->setLogDescriptionsToConsole(true);
  session->noteCheckpoint("hidden", kNow, "X");
  session->logQualityMetric("hidden", Number(1.0), "X");
  session->logDescription("described", "", "X", kNow);
  EXPECT_EQ(fakes.agentLog.lines,
            (Lines{"notice: === [Sender: X] shown   [14:03:07.251  (2024-05-02) (CEST)]",
                   "notice: === [Sender: X] described   [14:03:07.251  (2024-05-02) (CEST)]"}));
}

}  // namespace
}  // namespace zal::testing
