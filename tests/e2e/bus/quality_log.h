#pragma once

#include <map>
#include <string>
#include <vector>

namespace zal::testing {

/// A metric's block at the end of a quality log.
struct MetricStatistics {
  double average = 0, least = 0, greatest = 0, median = 0, deviation = 0;
};

/// A session's quality log, read as whoever evaluates it would.
struct QualityLog {
  /// By metric, in the order of the lines: the samples that the agent took itself.
  std::map<std::string, std::vector<double>> samples;
  std::map<std::string, MetricStatistics> statistics;
};

/// Blocks of another form than the agent's are left out.
[[nodiscard]] QualityLog readQualityLog(const std::string& text);
/// What belongs to these values, at least one.
[[nodiscard]] MetricStatistics statisticsOf(std::vector<double> values);
/// Fails the test where they differ by more than a last digit.
void expectSame(const MetricStatistics& found, const MetricStatistics& expected, const std::string& metric);

}  // namespace zal::testing
