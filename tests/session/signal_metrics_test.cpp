#include "session/signal_metrics.h"

#include <gtest/gtest.h>

#include "tests/support/fake_services.h"

namespace zal {
namespace {

class SignalMetricsTest : public ::testing::Test {
 protected:
  testing::FakeTelephony telephony;
  testing::FakeNetworkStatus network;
  /// Of services that answer at once.
  SignalMetricsSnapshot snapshot() {
    std::vector<SignalMetricsSnapshot> given;
    gatherSignalMetrics(telephony, network,
                        [&given](const SignalMetricsSnapshot& snapshot) { given.push_back(snapshot); });
    EXPECT_EQ(given.size(), 1U);
    return given.empty() ? SignalMetricsSnapshot{} : given.front();
  }
  const SignalMetricsSnapshot wifiOff{{"wifi-signal-rate", std::uint64_t{0}},
                                      {"wifi-signal-rssi", std::uint64_t{0}},
                                      {"wifi-signal-strength", std::uint64_t{0}}};
};

TEST_F(SignalMetricsTest, HoldsAllSixWhenTheHostTellsThem) {
  telephony.reachable = true;
  telephony.signal = CellularSignal{-87, 61, 3};
  network.associated = true;
  network.rssi = Number(std::int64_t{-55});
  network.strength = Number(0.75);
  network.rate = Number(std::uint64_t{866});
  EXPECT_EQ(snapshot(), (SignalMetricsSnapshot{{"cell-signal-graded", std::int64_t{3}},
                                               {"cell-signal-percentage", std::int64_t{61}},
                                               {"cell-signal-rssi", std::int64_t{-87}},
                                               {"wifi-signal-rate", std::uint64_t{866}},
                                               {"wifi-signal-rssi", std::int64_t{-55}},
                                               {"wifi-signal-strength", 0.75}}));
}

TEST_F(SignalMetricsTest, CountsWifiThatIsNotAssociatedAsZeros) { EXPECT_EQ(snapshot(), wifiOff); }

TEST_F(SignalMetricsTest, LeavesOutTheCellWhenTheQueryFails) {
  telephony.reachable = true;
  EXPECT_EQ(snapshot(), wifiOff);
}

TEST_F(SignalMetricsTest, LeavesOutEachWifiValueThatTheHostDoesNotHave) {
  network.associated = true;
  network.strength = Number(0.75);
  EXPECT_EQ(snapshot(), (SignalMetricsSnapshot{{"wifi-signal-strength", 0.75}}));
}

TEST_F(SignalMetricsTest, LeavesOutTheWifiThatDoesNotAnswerInTime) {
  telephony.reachable = true;
  telephony.signal = CellularSignal{-87, 61, 3};
  network.hangs = true;
  std::vector<SignalMetricsSnapshot> given;
  gatherSignalMetrics(telephony, network,
                      [&given](const SignalMetricsSnapshot& snapshot) { given.push_back(snapshot); });
  EXPECT_TRUE(given.empty());
  ASSERT_EQ(network.waiting.size(), 1U);
  network.waiting.front()(std::nullopt);
  EXPECT_EQ(given, (std::vector<SignalMetricsSnapshot>{{{"cell-signal-graded", std::int64_t{3}},
                                                        {"cell-signal-percentage", std::int64_t{61}},
                                                        {"cell-signal-rssi", std::int64_t{-87}}}}));
}

}  // namespace
}  // namespace zal
