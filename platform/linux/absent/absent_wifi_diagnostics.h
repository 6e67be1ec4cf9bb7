#pragma once

#include "platform/wifi_diagnostics.h"

namespace zal {

/// For a host without Wi-Fi diagnostics: every dump fails at once. Any thread.
class AbsentWifiDiagnostics : public WifiDiagnostics {
 public:
  static constexpr int kNotAvailable = -1;
  void takeDump(const std::string& /*directory*/, const std::string& /*reason*/,
                Completion completion) override {
    completion(kNotAvailable);
  }
};

}  // namespace zal
