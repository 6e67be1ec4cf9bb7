#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "platform/ipc_peer.h"
#include "session/optional_text.h"
#include "session/session_services.h"

namespace zal {

/// One action that a client asks for. Borrowed for the call.
struct ActionRequest {
  std::int64_t action = 0;
  OptionalText session;
  OptionalText sender;
  const std::shared_ptr<PeerConnection>& peer;  ///< may be empty
  const Message* request = nullptr;             ///< the message to reply to; may be absent
  const ValueMap* userInfo = nullptr;           ///< may be absent
};

/// What the server sets going in the diagnostics behind it. Each is called on the main thread and
/// does nothing unless it is given.
struct AgentHooks {
  /// A session is about to begin: bit 1 asks for ping tests, bit 2 for the system log.
  std::function<void(std::uint64_t beginFlags)> StartSessionCaptures = [](std::uint64_t) {};
  /// The state of the network into an existing directory.
  std::function<void(const std::string& directory, bool includePing)> ForceNetworkDump =
      [](const std::string&, bool) {};
  /// The last step of writing a session.
  std::function<void(const CollectionRequest&)> CollectServiceLogs = [](const CollectionRequest&) {};
  /// Carries out one action; activity is noted around it.
  std::function<void(const ActionRequest&)> performAction = [](const ActionRequest&) {};
};

}  // namespace zal
