#pragma once

#include "platform/network_status.h"

namespace zal {

/// For a host that cannot tell about its Wi-Fi: not associated, no values. Main thread only.
class AbsentNetworkStatus : public NetworkStatus {
 public:
  void sampleWifi(WifiHandler handler) override { handler(WifiSignal{}); }
};

}  // namespace zal
