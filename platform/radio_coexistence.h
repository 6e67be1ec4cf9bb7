#pragma once

#include <functional>

namespace zal {

/// The manager of radios that share one band. Any thread.
class RadioCoexistence {
 public:
  virtual ~RadioCoexistence() = default;
  /// What makes the manager write out its logs; empty where there is no manager.
  [[nodiscard]] virtual std::function<void()> logDumpEntryPoint() = 0;
};

}  // namespace zal
