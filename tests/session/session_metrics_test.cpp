#include <chrono>

#include "tests/session/session_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

class SessionMetricsTest : public SessionFixture {
 protected:
  static std::string entriesOf(const std::string& file) { return file.substr(file.find("[Sender: ")); }
};

TEST_F(SessionMetricsTest, ASessionEndedWithin5SecondsHasNoStatistics) {
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  host.advance(4999ms);
  session->endSessionWithSender("caller");
  EXPECT_EQ(entriesOf(qualityLog()), "[Sender: caller] End Session  [14:03:12.250  (2024-05-02) (CEST)]\n");
}

TEST_F(SessionMetricsTest, SamplesEvery5SecondsAndCountsWifiOffAsZero) {
  session->beginSessionWithSender("caller");
  host.advance(5000ms);
  host.advance(4999ms);
  session->endSessionWithSender("caller");
  EXPECT_EQ(entriesOf(qualityLog()),
            R"([Sender: Lirra] wifi-signal-rate: 0   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: Lirra] wifi-signal-rssi: 0   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: Lirra] wifi-signal-strength: 0   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:17.250  (2024-05-02) (CEST)]
========================================
  [wifi-signal-rate]
 Average: 0
     Min: 0
     Max: 0
  Median: 0
  StdDev: 0
========================================
  [wifi-signal-rssi]
 Average: 0
     Min: 0
     Max: 0
  Median: 0
  StdDev: 0
========================================
  [wifi-signal-strength]
 Average: 0
     Min: 0
     Max: 0
  Median: 0
  StdDev: 0
)");
}

TEST_F(SessionMetricsTest, SamplesOnThe10thSecondAgain) {
  fakes.networkStatus.associated = true;
  fakes.networkStatus.rssi = Number(std::int64_t{-55});
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  host.advance(10'000ms);
  session->endSessionWithSender("caller");
  EXPECT_EQ(entriesOf(qualityLog()),
            R"([Sender: Lirra] wifi-signal-rssi: -55   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: Lirra] wifi-signal-rssi: -55   [14:03:17.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:17.251  (2024-05-02) (CEST)]
========================================
  [wifi-signal-rssi]
 Average: -55
     Min: -55
     Max: -55
  Median: -55
  StdDev: 0
)");
}

TEST_F(SessionMetricsTest, SamplesTheCell) {
  fakes.telephony.reachable = true;
  fakes.telephony.signal = CellularSignal{-87, 61, 3};
  fakes.networkStatus.associated = true;
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  host.advance(5s);
  session->endSessionWithSender("caller");
  EXPECT_TRUE(entriesOf(qualityLog())
                  .starts_with(R"([Sender: Lirra] cell-signal-graded: 3   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: Lirra] cell-signal-percentage: 61   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: Lirra] cell-signal-rssi: -87   [14:03:12.251  (2024-05-02) (CEST)]
[Sender: caller] End Session)"));
}

TEST_F(SessionMetricsTest, TakesNoSampleAfterTheEnd) {
  session->beginSessionWithSender("caller");
  session->endSessionWithSender("caller");
  fakes.agentLog.enabledCategories = {"Logging"};
  host.advance(60s);
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(fakes.agentLog.lines, Lines{});
}

TEST_F(SessionMetricsTest, AnAnswerThatComesAfterTheEndIsNoSampleAndNoBegin) {
  fakes.networkStatus.hangs = true;
  session->beginSessionWithSender("caller");
  host.advance(5s);
  session->endSessionWithSender("caller");
  ASSERT_EQ(fakes.networkStatus.waiting.size(), 1U);
  fakes.networkStatus.waiting.front()(WifiSignal{});
  EXPECT_FALSE(session->isActive());
  session->beginSessionWithSender("caller");
  noteCheckpoints(2);
  fakes.networkStatus.waiting.front()(WifiSignal{});
  session->endSessionWithSender("caller");
  const std::string log =
      readFile(base + "/2024-05-02 at 14-03-12 (CEST) (Receiver)/Quality Log (14-03-12).log");
  EXPECT_NE(log, "");
  EXPECT_EQ(log.find("wifi-signal"), std::string::npos);
}

TEST_F(SessionMetricsTest, AForcedBeginStartsTheFiveSecondsAnew) {
  fakes.networkStatus.associated = true;
  fakes.networkStatus.rssi = Number(std::int64_t{-55});
  session->beginSessionWithSender("a");
  host.advance(3s);
  session->beginSessionWithSender("b");
  host.advance(4999ms);
  EXPECT_EQ(host.pendingTimers(), 2U);
  noteCheckpoints(2);
  host.advance(1ms);
  session->endSessionWithSender("b");
  EXPECT_NE(readFile(base + "/2024-05-02 at 14-03-10 (CEST) (Receiver)/Quality Log (14-03-10).log")
                .find("[Sender: Lirra] wifi-signal-rssi: -55   [14:03:15.251  (2024-05-02) (CEST)]\n"),
            std::string::npos);
}

TEST_F(SessionMetricsTest, AMetricWithAnAbsentValueOrNameIsIgnoredEntirely) {
  session->logQualityMetric("rtt", std::nullopt, "caller");
  session->logQualityMetric(std::nullopt, Number(1.0), "caller");
  EXPECT_FALSE(session->isActive());
  EXPECT_EQ(host.pendingTimers(), 0U);
  session->beginSessionWithSender("caller");
  session->logQualityMetric("rtt", std::nullopt, "caller");
  noteCheckpoints(2);
  session->endSessionWithSender("caller");
  EXPECT_EQ(entriesOf(qualityLog()), "[Sender: caller] End Session  [14:03:07.251  (2024-05-02) (CEST)]\n");
}

TEST_F(SessionMetricsTest, ASecondSessionsStatisticsCoverTheSamplesOfBoth) {
  session->logQualityMetric("rtt", Number(1.0), "caller");
  session->endSessionWithSender("ENDALL");
  host.advance(1s);
  session->logQualityMetric("rtt", Number(std::int64_t{4}), "caller");
  session->endSessionWithSender("caller");
  EXPECT_EQ(
      entriesOf(readFile(base + "/2024-05-02 at 14-03-08 (CEST) (Receiver)/Quality Log (14-03-08).log")),
      R"([Sender: caller] rtt: 4   [14:03:08.251  (2024-05-02) (CEST)]
[Sender: caller] End Session  [14:03:08.251  (2024-05-02) (CEST)]
========================================
  [rtt]
 Average: 2.5
     Min: 1
     Max: 4
  Median: 2.5
  StdDev: 1.5
)");
}

TEST_F(SessionMetricsTest, EchoesStatisticsButNoSamplesWithTheDescriptions) {
  session->setLogDescriptionsToConsole(true);
  session->logQualityMetric("rtt", Number(1.0), "caller");
  session->endSessionWithSender("caller");
  EXPECT_EQ(
      fakes.agentLog.lines,
      (Lines{"notice: ========================================", "notice:   [rtt]", "notice:  Average: 1",
             "notice:      Min: 1", "notice:      Max: 1", "notice:   Median: 1", "notice:   StdDev: 0",
             "notice: === [Time: Separator]", "notice: === [Reference Time: Unknown reference time!]"}));
}

}  // namespace
}  // namespace zal::testing
