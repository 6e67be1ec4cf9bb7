#pragma once

#include <functional>

#include "session/session_services.h"
#include "session/session_writings.h"

namespace zal {

class Collectors;
struct Platform;

/// What all sessions of the process share: the host's services, the collectors, and the caches that
/// live as long as the process. Main thread only; platform and collectors outlive it, and it outlives
/// every session.
class SessionEnvironment {
 public:
  /// The callback is the last step of writing a session.
  SessionEnvironment(Platform& platform, Collectors& collectors,
                     std::function<void(const CollectionRequest&)> CollectServiceLogs);
  SessionEnvironment(const SessionEnvironment&) = delete;
  SessionEnvironment& operator=(const SessionEnvironment&) = delete;

  [[nodiscard]] SessionServices& services() { return _services; }

 private:
  BuildInformationCache _buildInformation;
  TimeZoneCache _timeZone;
  SessionWritings _writings;
  SessionServices _services;
};

}  // namespace zal
