#include "session/metric_statistics.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <variant>

namespace zal {

namespace {

// Wide enough to hold every 64-bit integer exactly and to add up doubles without overflow.
using Wide = long double;

constexpr double kNoNumber = std::numeric_limits<double>::quiet_NaN();

Wide wide(const Number& number) {
  return std::visit([](auto value) { return static_cast<Wide>(value); }, number);
}

// The sign of a NaN says nothing, and "-nan" would be shown.
double narrow(Wide value) { return std::isnan(value) ? kNoNumber : static_cast<double>(value); }

// Adds up without letting many small rounding errors grow into a visible one.
class CompensatedSum {
 public:
  void add(Wide value) {
    const Wide next = _sum + value;
    const Wide lost = std::abs(_sum) >= std::abs(value) ? (_sum - next) + value : (value - next) + _sum;
    if (std::isfinite(next)) _lost += lost;
    _sum = next;
  }
  [[nodiscard]] Wide value() const { return std::isfinite(_sum) ? _sum + _lost : _sum; }

 private:
  Wide _sum = 0;
  Wide _lost = 0;
};

Wide middleOf(std::vector<Wide> values) {
  const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
  std::nth_element(values.begin(), middle, values.end());
  if (values.size() % 2 == 1) return *middle;
  const Wide below = *std::max_element(values.begin(), middle);
  return below == *middle ? below : (below + *middle) / 2;
}

}  // namespace

MetricStatistics statisticsOf(const std::vector<Number>& samples) {
  MetricStatistics result{kNoNumber, kNoNumber, kNoNumber, kNoNumber, kNoNumber};
  std::vector<Wide> values;
  values.reserve(samples.size());
  const Number* least = nullptr;
  const Number* greatest = nullptr;
  CompensatedSum sum;
  for (const Number& sample : samples) {
    const Wide value = wide(sample);
    sum.add(value);
    if (std::isnan(value)) continue;
    values.push_back(value);
    if (least == nullptr || value < wide(*least)) least = &sample;
    if (greatest == nullptr || value > wide(*greatest)) greatest = &sample;
  }
  if (values.empty()) return result;
  result.minimum = *least;
  result.maximum = *greatest;
  if (values.size() != samples.size()) return result;

  const auto count = static_cast<Wide>(values.size());
  const Wide average = sum.value() / count;
  CompensatedSum squares;
  for (const Wide value : values) squares.add((value - average) * (value - average));
  result.average = narrow(average);
  result.deviation = narrow(std::sqrt(squares.value() / count));
  result.median = narrow(middleOf(std::move(values)));
  return result;
}

std::array<std::string, 7> statisticsBlock(std::string_view name, const MetricStatistics& statistics) {
  return {std::string(40, '='),
          "  [" + std::string(name) + "]",
          " Average: " + numberText(statistics.average),
          "     Min: " + numberText(statistics.minimum),
          "     Max: " + numberText(statistics.maximum),
          "  Median: " + numberText(statistics.median),
          "  StdDev: " + numberText(statistics.deviation)};
}

}  // namespace zal
