#pragma once

#include <optional>

#include "platform/value.h"

namespace zal {

/// The Wi-Fi association as the host sees it. Main thread only; never waits for a daemon.
class NetworkStatus {
 public:
  virtual ~NetworkStatus() = default;
  /// False too on a host that cannot tell.
  [[nodiscard]] virtual bool isWifiAssociated() = 0;
  // Each only meaningful while associated; nothing when the host has no value.
  [[nodiscard]] virtual std::optional<Number> scaledRssi() = 0;      ///< dBm
  [[nodiscard]] virtual std::optional<Number> signalStrength() = 0;  ///< percent
  [[nodiscard]] virtual std::optional<Number> scaledRate() = 0;      ///< Mbit/s
};

}  // namespace zal
