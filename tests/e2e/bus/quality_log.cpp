#include "tests/e2e/bus/quality_log.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <regex>

namespace zal::testing {

QualityLog readQualityLog(const std::string& text) {
  static const std::regex sample(R"(\[Sender: Lirra\] ([a-z-]+): (\S+)   \[[^\n]*\]\n)");
  static const std::regex block(
      "={40}\n"
      "  \\[([^\n]*)\\]\n"
      " Average: (\\S+)\n"
      "     Min: (\\S+)\n"
      "     Max: (\\S+)\n"
      "  Median: (\\S+)\n"
      "  StdDev: (\\S+)\n");
  QualityLog log;
  const std::sregex_iterator end;
  for (std::sregex_iterator line(text.begin(), text.end(), sample); line != end; ++line) {
    log.samples[(*line)[1]].push_back(std::stod((*line)[2]));
  }
  for (std::sregex_iterator found(text.begin(), text.end(), block); found != end; ++found) {
    const std::smatch& parts = *found;
    log.statistics[parts[1]] = {.average = std::stod(parts[2]),
                                .least = std::stod(parts[3]),
                                .greatest = std::stod(parts[4]),
                                .median = std::stod(parts[5]),
                                .deviation = std::stod(parts[6])};
  }
  return log;
}

MetricStatistics statisticsOf(std::vector<double> values) {
  std::sort(values.begin(), values.end());
  const auto count = static_cast<double>(values.size());
  const std::size_t middle = values.size() / 2;
  const double average = std::accumulate(values.begin(), values.end(), 0.0) / count;
  double squares = 0;
  for (const double value : values) squares += (value - average) * (value - average);
  return {.average = average,
          .least = values.front(),
          .greatest = values.back(),
          .median = values.size() % 2 == 1 ? values[middle] : (values[middle - 1] + values[middle]) / 2,
          .deviation = std::sqrt(squares / count)};
}

void expectSame(const MetricStatistics& found, const MetricStatistics& expected, const std::string& metric) {
  constexpr double kLastDigit = 1e-9;
  EXPECT_NEAR(found.average, expected.average, kLastDigit) << metric;
  EXPECT_EQ(found.least, expected.least) << metric;
  EXPECT_EQ(found.greatest, expected.greatest) << metric;
  EXPECT_EQ(found.median, expected.median) << metric;
  EXPECT_NEAR(found.deviation, expected.deviation, kLastDigit) << metric;
}

}  // namespace zal::testing
