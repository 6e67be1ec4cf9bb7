#include "agent/agent_workshop.h"

namespace zal {

AgentWorkshop::AgentWorkshop(Platform& platform)
    : collectors(platform),
      sessions(
          platform, collectors,
          [this](const CollectionRequest& request) { diagnostics.collection.CollectServiceLogs(request); }),
      diagnostics(platform, collectors, sessions.services()) {}

AgentHooks AgentWorkshop::hooksInto(const std::shared_ptr<AgentWorkshop>& workshop) {
  AgentHooks hooks;
  hooks.StartSessionCaptures = [workshop](std::uint64_t beginFlags) {
    workshop->collectors.network.StartSessionCaptures(beginFlags);
  };
  hooks.ForceNetworkDump = [workshop](const std::string& directory, bool includePing) {
    workshop->collectors.network.ForceNetworkDump(directory, includePing);
  };
  hooks.performAction = [workshop](const ActionRequest& request, ActionServer& server) {
    workshop->diagnostics.dispatcher.performAction(request, server);
  };
  return hooks;
}

}  // namespace zal
