#include "agent/session_environment.h"

#include <utility>

#include "collectors/collectors.h"
#include "platform/platform.h"

namespace zal {

SessionEnvironment::SessionEnvironment(Platform& platform, Collectors& collectors,
                                       std::function<void(const CollectionRequest&)> CollectServiceLogs)
    : _writings(platform.mainLoop, platform.queues),
      _services{.clock = platform.clock,
                .mainLoop = platform.mainLoop,
                .localNotifications = platform.localNotifications,
                .agentLog = platform.agentLog,
                .telephony = platform.telephony,
                .networkStatus = platform.networkStatus,
                .deviceRegistry = platform.deviceRegistry,
                .systemVersion = platform.systemVersion,
                .files = platform.files,
                .commandRunner = collectors.commands,
                .fileCollector = collectors.files,
                .pingRunner = collectors.pings,
                .roots = platform.configuration.roots,
                .endpoints = platform.configuration.endpoints,
                .buildInformation = _buildInformation,
                .timeZone = _timeZone,
                .CollectServiceLogs = std::move(CollectServiceLogs),
                .sessionRecords = &platform.sessionRecords,
                .memory = &platform.memory,
                .spillFiles = &platform.spillFiles,
                .queues = &platform.queues,
                .writings = &_writings} {}

}  // namespace zal
