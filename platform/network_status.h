#pragma once

#include <functional>
#include <optional>

#include "platform/value.h"

namespace zal {

/// The Wi-Fi as the host sees it at one moment.
struct WifiSignal {
  bool isAssociated = false;
  // Each only meaningful while associated; nothing when the host has no value.
  std::optional<Number> scaledRssi;      ///< dBm
  std::optional<Number> signalStrength;  ///< percent
  std::optional<Number> scaledRate;      ///< Mbit/s
};

/// The host's network-status service. Main thread only.
class NetworkStatus {
 public:
  /// Not associated where there is no such service; nothing when it did not answer in time.
  using WifiHandler = std::function<void(std::optional<WifiSignal> signal)>;
  virtual ~NetworkStatus() = default;
  /// Never waits: the handler runs on the main thread, once, within a second, perhaps inside the call.
  /// While an earlier question is still open, a new one is answered with nothing at once.
  virtual void sampleWifi(WifiHandler handler) = 0;
};

}  // namespace zal
