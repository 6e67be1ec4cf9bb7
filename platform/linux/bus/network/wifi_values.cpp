#include "platform/linux/bus/network/wifi_values.h"

#include <algorithm>

namespace zal {
namespace {

constexpr std::int32_t kBestRssi = -40;
constexpr std::int32_t kWorstRssi = -100;

/// Drivers that know nothing leave 0 or a figure far out.
std::optional<std::int32_t> plausibleRssi(const std::optional<std::int32_t>& rssi) {
  return rssi && *rssi < 0 && *rssi > -200 ? rssi : std::nullopt;
}

}  // namespace

std::int64_t rssiOfStrength(std::uint8_t percent) {
  const std::int64_t missing = 100 - std::min<std::int64_t>(percent, 100);
  return kBestRssi - missing * (kBestRssi - kWorstRssi) / 100;
}

std::uint64_t strengthOfRssi(std::int32_t rssi) {
  const auto missing = static_cast<std::uint64_t>(kBestRssi - std::clamp(rssi, kWorstRssi, kBestRssi));
  return 100 - missing * 100 / static_cast<std::uint64_t>(kBestRssi - kWorstRssi);
}

WifiSignal associatedSignal(const WifiValues& values) {
  WifiSignal signal;
  signal.isAssociated = true;
  auto rssi = plausibleRssi(values.polledRssi);
  if (!rssi) rssi = plausibleRssi(values.scanRssi);
  if (values.strength) {
    signal.signalStrength = std::uint64_t{*values.strength};
    signal.scaledRssi = rssi ? std::int64_t{*rssi} : rssiOfStrength(*values.strength);
  } else if (rssi) {
    signal.signalStrength = strengthOfRssi(*rssi);
    signal.scaledRssi = std::int64_t{*rssi};
  }
  if (values.bitRate.value_or(0) != 0) {
    signal.scaledRate = *values.bitRate / 1000.0;
  } else if (values.linkSpeed.value_or(0) > 0) {
    signal.scaledRate = std::int64_t{*values.linkSpeed};
  }
  return signal;
}

}  // namespace zal
