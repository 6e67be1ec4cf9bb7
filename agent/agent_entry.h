#pragma once

#include "agent/agent_hooks.h"
#include "platform/platform.h"
#include "session/session_services.h"

namespace zal {

/// The agent from start to end: makes the shared server, opens its listener and runs the main loop.
/// A std::exception that escapes the loop is reported as if the process had crashed, and ends it in
/// good order; anything else that is thrown passes through. Returned: the exit status, always 0.
/// Main thread only; what is given outlives the process's use of the server.
int runAgent(Platform& platform, SessionServices& sessionServices, AgentHooks hooks);
/// The same with everything behind the server, made here once and kept until the process is gone.
int runAgent(Platform& platform);

}  // namespace zal
