#include "agent/session_environment.h"

#include <utility>

namespace zal {

SessionEnvironment::SessionEnvironment(Platform& platform,
                                       std::function<void(const CollectionRequest&)> CollectServiceLogs)
    : _commandRunner(platform.shell),
      _fileCollector(platform.files, platform.agentLog, platform.configuration.roots),
      _pingRunner(platform.queues, platform.pings, platform.agentLog),
      _services{.clock = platform.clock,
                .mainLoop = platform.mainLoop,
                .localNotifications = platform.localNotifications,
                .agentLog = platform.agentLog,
                .telephony = platform.telephony,
                .networkStatus = platform.networkStatus,
                .deviceRegistry = platform.deviceRegistry,
                .systemVersion = platform.systemVersion,
                .files = platform.files,
                .commandRunner = _commandRunner,
                .fileCollector = _fileCollector,
                .pingRunner = _pingRunner,
                .roots = platform.configuration.roots,
                .endpoints = platform.configuration.endpoints,
                .buildInformation = _buildInformation,
                .timeZone = _timeZone,
                .CollectServiceLogs = std::move(CollectServiceLogs)} {
  _ZalLoggingAgentPingRunner::setSharedInstance(&_pingRunner);
}

SessionEnvironment::~SessionEnvironment() { _ZalLoggingAgentPingRunner::setSharedInstance(nullptr); }

}  // namespace zal
