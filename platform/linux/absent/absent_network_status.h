#pragma once

#include "platform/network_status.h"

namespace zal {

/// For a host that cannot tell about its Wi-Fi: not associated, no values. Main thread only.
class AbsentNetworkStatus : public NetworkStatus {
 public:
  [[nodiscard]] bool isWifiAssociated() override { return false; }
  [[nodiscard]] std::optional<Number> scaledRssi() override { return std::nullopt; }
  [[nodiscard]] std::optional<Number> signalStrength() override { return std::nullopt; }
  [[nodiscard]] std::optional<Number> scaledRate() override { return std::nullopt; }
};

}  // namespace zal
