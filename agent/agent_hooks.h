#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "dump/action_request.h"
#include "dump/action_server.h"

namespace zal {

/// What the server sets going in the diagnostics behind it. Each is called on the main thread and
/// does nothing unless it is given. They may keep what they call alive.
struct AgentHooks {
  /// A session is about to begin: bit 1 asks for ping tests, bit 2 for the system log.
  std::function<void(std::uint64_t beginFlags)> StartSessionCaptures = [](std::uint64_t) {};
  /// The state of the network into an existing directory.
  std::function<void(const std::string& directory, bool includePing)> ForceNetworkDump =
      [](const std::string&, bool) {};
  /// Carries out one action; activity is noted around it.
  std::function<void(const ActionRequest&, ActionServer&)> performAction = [](const ActionRequest&,
                                                                              ActionServer&) {};
};

}  // namespace zal
