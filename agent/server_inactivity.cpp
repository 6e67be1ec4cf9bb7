// The idle timer of the server: when the process has nothing to do any more.

#include <chrono>

#include "agent/zal_logging_agent_server.h"
#include "session/session_writings.h"

namespace zal {

void ZalLoggingAgentServer::_noteActivity() {
  _mainThread.check("ZalLoggingAgentServer");
  if (!_sessions.empty()) return;
  _lastActivity = _platform.clock.steadyNowRoughly();
  _setInactivityTimer();
}

void ZalLoggingAgentServer::_setInactivityTimer() {
  if (!_sessions.empty()) return;
  // An armed timer stays as it is: activity only moves _lastActivity, which costs nothing per record.
  if (_pendingInactivityTimer) return;
  _pendingInactivityTimer = true;
  _inactivityRequest =
      ScopedTimer(_platform.mainLoop,
                  _platform.mainLoop.callAfter(_inactivityLimit(), [this] { _serverBecameInactive(); }));
}

void ZalLoggingAgentServer::_clearInactivityTimer() {
  _pendingInactivityTimer = false;
  _inactivityRequest.cancel();
  _lastActivity.reset();
}

void ZalLoggingAgentServer::_serverBecameInactive() {
  _pendingInactivityTimer = false;
  terminate();
}

void ZalLoggingAgentServer::terminate() {
  _mainThread.check("ZalLoggingAgentServer");
  const SteadyTime now = _platform.clock.steadyNow();
  const auto idle = std::chrono::abs(now - _lastActivity.value_or(now));
  if (idle <= _inactivityLimit()) {
    _setInactivityTimer();
    return;
  }
  _clearInactivityTimer();
  if (_automationRunning) return;
  if (_sessionServices.writings != nullptr) _sessionServices.writings->finishAll();
  _platform.processExit.exit(0);
}

}  // namespace zal
