#pragma once

#include <functional>
#include <string>

namespace zal {

/// The host's Wi-Fi diagnostics. Any thread.
class WifiDiagnostics {
 public:
  /// 0 when the dump was taken, else the service's own number. Runs once, on any thread.
  using Completion = std::function<void(int result)>;
  virtual ~WifiDiagnostics() = default;
  /// Fills the existing directory. Returns at once; a service that is not there completes inside
  /// the call, so that nobody waits for it.
  virtual void takeDump(const std::string& directory, const std::string& reason, Completion completion) = 0;
};

}  // namespace zal
