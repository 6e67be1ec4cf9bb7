#include "session/metric_statistics.h"

#include <gtest/gtest.h>

#include <limits>

namespace zal {
namespace {

constexpr double kInfinity = std::numeric_limits<double>::infinity();
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

std::string blockOf(const std::vector<Number>& samples) {
  std::string text;
  for (const auto& line : statisticsBlock("rtt", statisticsOf(samples))) text += line + "\n";
  return text;
}

TEST(MetricStatisticsTest, PrintsTheBlockOfEightSamples) {
  EXPECT_EQ(blockOf({2.0, 4.0, 4.0, 4.0, 5.0, 5.0, 7.0, 9.0}), R"(========================================
  [rtt]
 Average: 5
     Min: 2
     Max: 9
  Median: 4.5
  StdDev: 2
)");
}

TEST(MetricStatisticsTest, TakesSamplesInAnyOrder) {
  const std::vector<Number> samples{9.0, 4.0, 5.0, 2.0, 4.0, 7.0, 5.0, 4.0};
  EXPECT_EQ(blockOf(samples), blockOf({2.0, 4.0, 4.0, 4.0, 5.0, 5.0, 7.0, 9.0}));
}

TEST(MetricStatisticsTest, OfOneSampleAllAreThatSample) {
  EXPECT_EQ(blockOf({std::int64_t{-7}}), R"(========================================
  [rtt]
 Average: -7
     Min: -7
     Max: -7
  Median: -7
  StdDev: 0
)");
}

TEST(MetricStatisticsTest, TakesTheMiddleOneOfAnOddCount) {
  EXPECT_EQ(statisticsOf({10.0, 1.0, 3.0}).median, 3.0);
}

TEST(MetricStatisticsTest, DividesTheVarianceByTheCount) {
  EXPECT_EQ(statisticsOf({1.0, 3.0}).deviation, 1.0);
}

TEST(MetricStatisticsTest, KeepsExtremesAsTheyCame) {
  const auto statistics = statisticsOf({std::int64_t{9007199254740993}, std::uint64_t{18446744073709551615U},
                                        1.5, true, std::int64_t{-9223372036854775807}});
  EXPECT_EQ(numberText(statistics.minimum), "-9223372036854775807");
  EXPECT_EQ(numberText(statistics.maximum), "18446744073709551615");
}

TEST(MetricStatisticsTest, TellsLargeIntegersApart) {
  const auto statistics = statisticsOf({std::int64_t{9007199254740993}, std::int64_t{9007199254740992}});
  EXPECT_EQ(numberText(statistics.minimum), "9007199254740992");
  EXPECT_EQ(numberText(statistics.maximum), "9007199254740993");
}

TEST(MetricStatisticsTest, DoesNotOverflowOnTheWay) {
  EXPECT_EQ(statisticsOf({1e308, 1e308, 1e308}).average, 1e308);
  EXPECT_EQ(statisticsOf({1e308, 1e308}).median, 1e308);
}

TEST(MetricStatisticsTest, LosesNoSmallSamplesBesideLargeOnes) {
  std::vector<Number> samples(1'000'000, Number(0.1));
  EXPECT_EQ(statisticsOf(samples).average, 0.1);
}

TEST(MetricStatisticsTest, SurvivesSamplesThatAreNoNumbers) {
  EXPECT_EQ(blockOf({3.0, kNaN, 1.0, -kNaN}), R"(========================================
  [rtt]
 Average: nan
     Min: 1
     Max: 3
  Median: nan
  StdDev: nan
)");
  EXPECT_EQ(blockOf({kNaN}), R"(========================================
  [rtt]
 Average: nan
     Min: nan
     Max: nan
  Median: nan
  StdDev: nan
)");
}

TEST(MetricStatisticsTest, SurvivesInfinities) {
  EXPECT_EQ(blockOf({1.0, kInfinity, 2.0}), R"(========================================
  [rtt]
 Average: inf
     Min: 1
     Max: inf
  Median: 2
  StdDev: nan
)");
  EXPECT_EQ(blockOf({kInfinity, -kInfinity}), R"(========================================
  [rtt]
 Average: nan
     Min: -inf
     Max: inf
  Median: nan
  StdDev: nan
)");
  EXPECT_EQ(statisticsOf({kInfinity, kInfinity}).median, kInfinity);
}

TEST(MetricStatisticsTest, OfNothingEverythingIsNoNumber) {
  EXPECT_EQ(numberText(statisticsOf({}).minimum), "nan");
  EXPECT_EQ(numberText(statisticsOf({}).average), "nan");
}

}  // namespace
}  // namespace zal
