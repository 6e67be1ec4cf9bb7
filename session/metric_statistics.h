#pragma once

#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "platform/value.h"

namespace zal {

/// What a list of samples amounts to. Least and greatest are samples, kept as they came.
struct MetricStatistics {
  double average = 0;
  Number minimum = 0.0;
  Number maximum = 0.0;
  double median = 0;     ///< of an even count the mean of the two in the middle
  double deviation = 0;  ///< standard deviation of the whole population
};

/// Any samples: with one that is no number among them, average, median and deviation are none either,
/// while minimum and maximum are those of the real ones. Of no samples everything is no number.
[[nodiscard]] MetricStatistics statisticsOf(const std::vector<Number>& samples);

/// The block of one metric, line by line.
[[nodiscard]] std::array<std::string, 7> statisticsBlock(std::string_view name,
                                                         const MetricStatistics& statistics);

}  // namespace zal
