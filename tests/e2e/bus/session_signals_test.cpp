#include "tests/e2e/bus/bus_e2e_fixture.h"
#include "tests/e2e/bus/quality_log.h"

namespace zal::testing {
namespace {

using ::testing::AnyOf;
using ::testing::Each;

/// What a beat may have found: what was there before, or what was set as soon as it was seen; or, where an
/// answer took its time on a busy host, what the beat before it may have found.
struct Expected {
  double before, after;
};

class SessionSignalsE2eTest : public BusE2eFixture {
 protected:
  static void expectSamples(const QualityLog& log, const std::string& metric,
                            const std::vector<Expected>& beats) {
    const auto found = log.samples.find(metric);
    ASSERT_NE(found, log.samples.end()) << metric;
    const std::vector<double>& samples = found->second;
    ASSERT_EQ(samples.size(), beats.size()) << metric;
    for (std::size_t beat = 0; beat < beats.size(); ++beat) {
      const double late = beats[beat == 0 ? 0 : beat - 1].before;
      EXPECT_THAT(samples[beat], AnyOf(beats[beat].before, beats[beat].after, late)) << metric << " " << beat;
    }
    // Whichever of the two it was: they follow what changes.
    EXPECT_GE(std::set<double>(samples.begin(), samples.end()).size(), 3U) << metric;
  }
};

TEST_F(SessionSignalsE2eTest, ThirtySecondsOfAChangingSignalAreInTheQualityLogAndItsStatistics) {
  constexpr int kBeats = 6;
  // One bar of the modem's five more or less each time: less it does not say by itself.
  const char* const strengths[] = {"csq=26", "csq=20", "csq=14", "csq=8", "csq=2", "csq=8", "csq=14"};
  startModem({strengths[0]});
  startWifi({.strength = 90, .rssi = -45, .rate = 866});
  start();
  lirra::Client client = makeClient();
  client.beginSession("Vistel");
  client.checkpoint("Vistel", "Connected", 1714651381.5);

  std::vector<Expected> percentages, wifiStrengths, wifiRssis, wifiRates;
  PlayedWifi::Signal signal{.strength = 90, .rssi = -45, .rate = 866};
  for (int beat = 1; beat <= kBeats; ++beat) {
    const int before = percentage();
    waitForPolls(static_cast<std::size_t>(beat));
    percentages.push_back({static_cast<double>(before), static_cast<double>(percentage())});
    const PlayedWifi::Signal last = signal;
    signal = {.strength = 90 - 10 * beat, .rssi = -45 - 5 * beat, .rate = 866 - 100 * beat};
    wifi->set(signal);
    wifiStrengths.push_back({static_cast<double>(last.strength), static_cast<double>(signal.strength)});
    wifiRssis.push_back({static_cast<double>(last.rssi), static_cast<double>(signal.rssi)});
    wifiRates.push_back({static_cast<double>(last.rate), static_cast<double>(signal.rate)});
    modem->set({strengths[beat]});
    ASSERT_TRUE(eventually([&] { return percentage() != percentages.back().after; }, kDeadline))
        << percentage();
  }
  client.endSession("Vistel");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  ASSERT_TRUE(eventually([&] { return !sandbox.sessionFile("Vistel", "Quality Log").empty(); }, kDeadline));

  const QualityLog log = readQualityLog(sandbox.sessionFile("Vistel", "Quality Log"));
  expectSamples(log, "cell-signal-percentage", percentages);
  expectSamples(log, "wifi-signal-strength", wifiStrengths);
  expectSamples(log, "wifi-signal-rssi", wifiRssis);
  expectSamples(log, "wifi-signal-rate", wifiRates);
  EXPECT_EQ(log.samples.size(), 6U);
  EXPECT_EQ(log.statistics.size(), 6U);
  for (const auto& [metric, samples] : log.samples) {
    expectSame(log.statistics.at(metric), statisticsOf(samples), metric);
  }
  // This modem measures no power: it follows from the percentage.
  for (std::size_t beat = 0; beat < kBeats; ++beat) {
    EXPECT_EQ(log.samples.at("cell-signal-rssi")[beat],
              -113 + 2 * std::lround(log.samples.at("cell-signal-percentage")[beat] * 31 / 100));
  }
  EXPECT_EQ(agent->terminate(), 0);
}

}  // namespace
}  // namespace zal::testing
