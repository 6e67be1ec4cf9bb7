#include "collectors/collectors.h"

#include "platform/platform.h"

namespace zal {

Collectors::Collectors(Platform& platform)
    : commands(platform.shell, platform.files, platform.agentLog, &witnesses),
      table(platform.configuration, platform.agentLog),
      files(platform.files, platform.agentLog, platform.configuration.roots, &witnesses),
      pings(platform.queues, platform.pings, platform.agentLog),
      cellular(platform.telephony, platform.propertyLists, platform.agentLog),
      network({.configuration = platform.configuration,
               .log = platform.agentLog,
               .queues = platform.queues,
               .preferences = platform.preferences,
               .deviceSupport = platform.deviceSupport,
               .shell = platform.shell,
               .commands = commands,
               .table = table,
               .files = files,
               .cellular = cellular,
               .pings = pings}),
      logs({.configuration = platform.configuration,
            .clock = platform.clock,
            .log = platform.agentLog,
            .queues = platform.queues,
            .placement = platform.files,
            .commands = commands,
            .table = table,
            .files = files}) {
  _ZalLoggingAgentPingRunner::setSharedInstance(&pings);
}

Collectors::~Collectors() { _ZalLoggingAgentPingRunner::setSharedInstance(nullptr); }

}  // namespace zal
