#include "tests/e2e/bus/bus_e2e_fixture.h"
#include "tests/e2e/bus/quality_log.h"

namespace zal::testing {
namespace {

/// What a signal was, and how many polls there had been when it was about to become that and when it surely
/// was.
struct Phase {
  double value;
  std::size_t pollsBefore, pollsAfter;
};

class SessionSignalsE2eTest : public BusE2eFixture {
 protected:
  /// However late this test was on a busy host: a beat finds what was there at its poll, or, as it asks for
  /// its values one after the other, what was there when it began.
  static bool mayHaveFound(const std::vector<Phase>& phases, std::size_t poll, double value) {
    for (std::size_t i = 0; i < phases.size(); ++i) {
      const bool hasBegun = poll > phases[i].pollsBefore;
      const bool isOver = i + 1 < phases.size() && poll > phases[i + 1].pollsAfter + 1;
      if (hasBegun && !isOver && phases[i].value == value) return true;
    }
    return false;
  }
  void expectSamples(const QualityLog& log, const std::string& metric, std::size_t pollsBeforeTheEnd,
                     const std::vector<Phase>& phases) const {
    const auto found = log.samples.find(metric);
    ASSERT_NE(found, log.samples.end()) << metric;
    const std::vector<double>& samples = found->second;
    // A session may end within a beat: what has not answered by then is no sample, what was asked first is
    // one although the Wi-Fi's turn never came.
    ASSERT_GE(samples.size() + 1, pollsBeforeTheEnd) << metric;
    ASSERT_LE(samples.size(), wifi->polls() + 1) << metric;
    for (std::size_t beat = 0; beat < samples.size(); ++beat) {
      EXPECT_TRUE(mayHaveFound(phases, beat + 1, samples[beat]))
          << metric << " " << beat << ": " << samples[beat];
    }
    // Whichever it was: they follow what changes.
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

  PlayedWifi::Signal signal{.strength = 90, .rssi = -45, .rate = 866};
  std::vector<Phase> percentages{{static_cast<double>(percentage()), 0, 0}}, wifiStrengths{{90, 0, 0}},
      wifiRssis{{-45, 0, 0}}, wifiRates{{866, 0, 0}};
  for (int beat = 1; beat <= kBeats; ++beat) {
    waitForPolls(static_cast<std::size_t>(beat));
    signal = {.strength = 90 - 10 * beat, .rssi = -45 - 5 * beat, .rate = 866 - 100 * beat};
    const std::size_t before = wifi->polls();
    wifi->set(signal);
    const std::size_t after = wifi->polls();
    wifiStrengths.push_back({static_cast<double>(signal.strength), before, after});
    wifiRssis.push_back({static_cast<double>(signal.rssi), before, after});
    wifiRates.push_back({static_cast<double>(signal.rate), before, after});
    modem->set({strengths[beat]});
    ASSERT_TRUE(eventually([&] { return percentage() != percentages.back().value; }, kDeadline))
        << percentage();
    percentages.push_back({static_cast<double>(percentage()), after, wifi->polls()});
  }
  const std::size_t pollsBeforeTheEnd = wifi->polls();
  client.endSession("Vistel");
  ASSERT_EQ(client.flush(60'000), LIRRA_OK);
  ASSERT_TRUE(eventually([&] { return !sandbox.sessionFile("Vistel", "Quality Log").empty(); }, kDeadline));

  const QualityLog log = readQualityLog(sandbox.sessionFile("Vistel", "Quality Log"));
  expectSamples(log, "cell-signal-percentage", pollsBeforeTheEnd, percentages);
  expectSamples(log, "wifi-signal-strength", pollsBeforeTheEnd, wifiStrengths);
  expectSamples(log, "wifi-signal-rssi", pollsBeforeTheEnd, wifiRssis);
  expectSamples(log, "wifi-signal-rate", pollsBeforeTheEnd, wifiRates);
  EXPECT_EQ(log.samples.size(), 6U);
  EXPECT_EQ(log.statistics.size(), 6U);
  for (const auto& [metric, samples] : log.samples) {
    expectSame(log.statistics.at(metric), statisticsOf(samples), metric);
  }
  // This modem measures no power: it follows from the percentage.
  for (std::size_t beat = 0; beat < log.samples.at("cell-signal-rssi").size(); ++beat) {
    EXPECT_EQ(log.samples.at("cell-signal-rssi")[beat],
              -113 + 2 * std::lround(log.samples.at("cell-signal-percentage")[beat] * 31 / 100));
  }
  EXPECT_EQ(agent->terminate(), 0);
}

}  // namespace
}  // namespace zal::testing
