#pragma once

#include <memory>

#include "agent/agent_hooks.h"
#include "agent/session_environment.h"
#include "collectors/collectors.h"
#include "dump/diagnostics.h"

namespace zal {

/// Everything that stands behind the server, each made once from the host's services: the
/// collectors, what sessions share, and the diagnostics. Made on the main thread; the platform
/// outlives it, and it outlives every session and every dump.
class AgentWorkshop {
 public:
  explicit AgentWorkshop(Platform& platform);
  AgentWorkshop(const AgentWorkshop&) = delete;
  AgentWorkshop& operator=(const AgentWorkshop&) = delete;

  /// What the server calls. The hooks keep the workshop.
  [[nodiscard]] static AgentHooks hooksInto(const std::shared_ptr<AgentWorkshop>& workshop);

  Collectors collectors;
  SessionEnvironment sessions;
  Diagnostics diagnostics;
};

}  // namespace zal
