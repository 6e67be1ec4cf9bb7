#include "agent/agent_entry.h"

#include <exception>
#include <memory>
#include <string>
#include <utility>

#include "agent/agent_workshop.h"
#include "agent/session_recovery.h"
#include "agent/zal_logging_agent_server.h"

namespace zal {
namespace {

void followHostSignals(Platform& platform, ZalLoggingAgentServer& server) {
  platform.hostSignals.onTerminate([&platform, &server] {
    server.stop();
    platform.logFacility.flush();
    platform.processExit.exit(0);
  });
  platform.hostSignals.onReload([&server] { server.readLoggingPreferences(); });
}

void runMainLoop(Platform& platform) {
  try {
    platform.mainLoop.run();
  } catch (const std::exception& exception) {
    platform.agentLog.warning(std::string("ZalLoggingAgentServer exception caught on main thread: ") +
                              exception.what());
    platform.agentLog.backtrace();
    platform.crashReporter.simulateCrashForException(exception.what());
  }
}

}  // namespace

int runAgent(Platform& platform, SessionServices& sessionServices, AgentHooks hooks) {
  ZalLoggingAgentServer::lendPlatform(platform, sessionServices, std::move(hooks));
  ZalLoggingAgentServer* const server = ZalLoggingAgentServer::sharedInstance();
  if (server == nullptr) {
    platform.agentLog.warning("Could not create ZalLoggingAgentServer server");
    return 0;
  }
  followHostSignals(platform, *server);
  recoverSessions(platform, sessionServices);
  server->start();
  runMainLoop(platform);
  platform.logFacility.flush();
  return 0;
}

int runAgent(Platform& platform) {
  // Nothing but the hooks keeps it, and the server, which is never destroyed, keeps the hooks: jobs in
  // the background may use it until the process is gone.
  const auto workshop = std::make_shared<AgentWorkshop>(platform);
  return runAgent(platform, workshop->sessions.services(), AgentWorkshop::hooksInto(workshop));
}

}  // namespace zal
