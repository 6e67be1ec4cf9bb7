#pragma once

#include <functional>

#include "collectors/command_runner.h"
#include "collectors/file_collector.h"
#include "collectors/ping_runner.h"
#include "platform/platform.h"
#include "session/session_services.h"

namespace zal {

/// What all sessions of the process share, put together from the host's services: the collectors and
/// the caches that live as long as the process. Names the process's ping runner. Main thread only;
/// the platform outlives it, and it outlives every session.
class SessionEnvironment {
 public:
  SessionEnvironment(Platform& platform, std::function<void(const CollectionRequest&)> CollectServiceLogs);
  ~SessionEnvironment();
  SessionEnvironment(const SessionEnvironment&) = delete;
  SessionEnvironment& operator=(const SessionEnvironment&) = delete;

  [[nodiscard]] SessionServices& services() { return _services; }

 private:
  CommandRunner _commandRunner;
  FileCollector _fileCollector;
  _ZalLoggingAgentPingRunner _pingRunner;
  BuildInformationCache _buildInformation;
  TimeZoneCache _timeZone;
  SessionServices _services;
};

}  // namespace zal
