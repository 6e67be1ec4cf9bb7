#pragma once

#include <string>
#include <vector>

namespace zal::bench {

/// One figure beside its peer's. Empty fields print as empty; a verdict comes only with a target.
struct Row {
  std::string figure;
  std::string ours;
  std::string peer;
  std::string ratio;
  std::string target;
  std::string verdict;
};

[[nodiscard]] std::string decimal(double value, int digits);
/// 123456 as "123 k/s".
[[nodiscard]] std::string rate(double perSecond);
/// Seconds with the unit that suits them.
[[nodiscard]] std::string duration(double seconds);

/// The ratio ours / peer against the least or the most that it may be.
[[nodiscard]] Row atLeast(std::string figure, double ours, double peer, double target,
                          std::string (*text)(double));
[[nodiscard]] Row atMost(std::string figure, double ours, double peer, double target,
                         std::string (*text)(double));
/// A figure with no target.
[[nodiscard]] Row plain(std::string figure, double ours, double peer, std::string (*text)(double));
/// Nothing to compare with: why.
[[nodiscard]] Row skipped(std::string figure, std::string why);

void printTable(const std::vector<Row>& rows);

}  // namespace zal::bench
