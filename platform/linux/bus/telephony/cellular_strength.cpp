#include "platform/linux/bus/telephony/cellular_strength.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace zal {
namespace {

/// The highest percentage of 0, 1, 2 and 3 bars.
constexpr std::array kHighestOfBars = {5, 30, 55, 80};

constexpr double kWeakestStep = -113;
constexpr double kStepWidth = 2;
constexpr double kSteps = 31;
constexpr double kLowestPower = -200;

bool isPower(double rssi) { return rssi >= kLowestPower && rssi <= 0; }

double powerOf(int percentage) { return kWeakestStep + kStepWidth * std::round(percentage * kSteps / 100); }

}  // namespace

int gradedStrength(int percentage) {
  const auto bars = std::lower_bound(kHighestOfBars.begin(), kHighestOfBars.end(), percentage);
  return static_cast<int>(bars - kHighestOfBars.begin());
}

CellularSignal cellularSignal(int percentage, std::optional<double> rssi) {
  percentage = std::clamp(percentage, 0, 100);
  const double power = rssi && isPower(*rssi) ? *rssi : powerOf(percentage);
  return {.rssi = static_cast<int>(std::lround(power)),
          .percentage = percentage,
          .graded = gradedStrength(percentage)};
}

}  // namespace zal
