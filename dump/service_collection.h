#pragma once

#include <atomic>
#include <functional>
#include <string>

#include "dump/closing_stages.h"
#include "session/session_services.h"

namespace zal {

class Collectors;
class _LirraLogCompressor;
struct Platform;

/// The Wi-Fi diagnostics dump gets this long, and its caller waits for it.
inline constexpr std::chrono::seconds kWifiDiagnosticsLimit{15};

/// Gathers into one directory the logs that belong to one service, step by step as the flags say,
/// and hands over to the closing stages. Main thread only; the services are borrowed.
class ServiceCollection {
 public:
  struct Services {
    Platform& platform;
    Collectors& collectors;
    ClosingStages& closing;
  };
  explicit ServiceCollection(const Services& services) : _services(services) {}

  /// Returns when the closing stages are queued, or their first one is done when the request is not
  /// for the background. The completion runs once, on the main thread, when the archive is made.
  void CollectServiceLogs(const CollectionRequest& request, std::function<void()> completion = {});

 private:
  Services _services;
  bool _lookedUpCoexistence = false;
  std::function<void()> _dumpCoexistence;
};

}  // namespace zal
