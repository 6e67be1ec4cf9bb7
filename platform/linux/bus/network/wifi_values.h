#pragma once

#include <cstdint>
#include <optional>

#include "platform/network_status.h"

namespace zal {

/// What the daemons say of an association, each in its own unit; nothing when they do not.
struct WifiValues {
  std::optional<std::uint8_t> strength = {};    ///< percent: NetworkManager's, of the access point
  std::optional<std::uint32_t> bitRate = {};    ///< kbit/s: NetworkManager's; 0 when it does not know
  std::optional<std::int32_t> polledRssi = {};  ///< dBm: wpa_supplicant asked the driver a moment ago
  std::optional<std::int32_t> scanRssi = {};    ///< dBm: wpa_supplicant's, of the last scan
  std::optional<std::int32_t> linkSpeed = {};   ///< Mbit/s: wpa_supplicant's; 0 when it does not know
};

/// An association's values. The RSSI is the polled one, else the last scan's, else follows from the
/// strength; without a strength it is the other way round. The rate is the bit rate in Mbit/s, its
/// fraction kept, else the link speed.
[[nodiscard]] WifiSignal associatedSignal(const WifiValues& values);

/// dBm: 100 percent are -40 and 0 percent -100, the scale on which NetworkManager makes percents.
[[nodiscard]] std::int64_t rssiOfStrength(std::uint8_t percent);
/// Percent, the way back.
[[nodiscard]] std::uint64_t strengthOfRssi(std::int32_t rssi);

}  // namespace zal
