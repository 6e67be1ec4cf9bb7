// Which session of the server is open under which type: begin, end, inactivity.

#include <string>
#include <utility>

#include "agent/session_directory.h"
#include "agent/session_type_key.h"
#include "agent/zal_logging_agent_server.h"

namespace zal {
namespace {

constexpr std::string_view kSenderInactive = "INACTIVE";
constexpr std::string_view kSenderEndAll = "ENDALL";

std::optional<std::string> owned(OptionalText text) {
  return text ? std::optional<std::string>(*text) : std::nullopt;
}

}  // namespace

ZalLoggingAgentServer::Session ZalLoggingAgentServer::_sessionForSessionType(OptionalText type,
                                                                             bool allowCreation) {
  const std::string key = sessionTypeKey(type);
  if (const auto found = _sessions.find(key); found != _sessions.end()) return found->second;
  if (!allowCreation) return nullptr;
  auto session =
      std::make_shared<ZalLoggingAgentVistelSession>(key, sessionDirectory(_platform, key), _sessionServices);
  session->setLogCheckpointsToConsole(_switches.isConsoleOutput());
  session->setLogDescriptionsToConsole(_switches.isVerboseConsoleOutput());
  _sessions.emplace(key, session);
  return session;
}

void ZalLoggingAgentServer::beginSession(OptionalText type, OptionalText sender,
                                         std::int64_t beginSessionFlags, std::int64_t endSessionFlags) {
  readLoggingPreferences();
  if (!_switches.isCallLoggingEnabled()) return;
  _hooks.StartSessionCaptures(static_cast<std::uint64_t>(beginSessionFlags));
  const std::string key = sessionTypeKey(type);
  if (_sessions.contains(key)) endSession(key, sender, true);
  const Session session = _sessionForSessionType(key, true);
  session->setEndFlags(static_cast<std::uint32_t>(endSessionFlags));
  session->beginSessionWithSender(sender);
  session->setIsInitiator((beginSessionFlags & kBeginFlagInitiator) != 0);
  _clearInactivityTimer();
}

void ZalLoggingAgentServer::endSession(OptionalText type, OptionalText sender) {
  endSession(type, sender, false);
  _noteActivity();
}

void ZalLoggingAgentServer::endSession(OptionalText type, OptionalText sender, bool endNow) {
  readLoggingPreferences();
  if (!_switches.isCallLoggingEnabled()) return;
  const EndRequest request{std::string(sessionTypeOrDefault(type)), owned(sender)};
  if (endNow) {
    _reallyEndSession(request);
  } else {
    // Never cancelled, not even by a later begin of the type.
    _platform.mainLoop.callAfter(_platform.configuration.delayedEnd.value_or(kDelayedEndInterval),
                                 [this, request, alive = std::weak_ptr<void>(_delayedEnds)] {
                                   if (!alive.expired()) _reallyEndSession(request);
                                 });
  }
  _noteActivity();
}

void ZalLoggingAgentServer::_reallyEndSession(const EndRequest& request) {
  _mainThread.check("ZalLoggingAgentServer");
  if (!_switches.isCallLoggingEnabled()) return;
  if (const Session session = _sessionForSessionType(request.first, false)) {
    session->endSessionWithSender(request.second);
    // By the type as the client sent it, not by its key: a type with path components ends its
    // session and leaves it registered.
    _sessions.erase(request.first);
  }
  _noteActivity();
}

void ZalLoggingAgentServer::_sessionBecameInactive(void* object) {
  if (auto* const session = static_cast<ZalLoggingAgentVistelSession*>(object)) {
    session->endSessionWithSender(kSenderInactive);
    std::erase_if(_sessions, [session](const auto& entry) { return entry.second.get() == session; });
  }
  _noteActivity();
}

void ZalLoggingAgentServer::endAllSessions() {
  _mainThread.check("ZalLoggingAgentServer");
  // A copy: what an end sets going may come back to the registry.
  const Sessions open = _sessions;
  for (const auto& [key, session] : open) session->endSessionWithSender(kSenderEndAll);
  _noteActivity();
}

void ZalLoggingAgentServer::_notePoorNetworkConditions() {
  _platform.agentLog.console("", "** Noting poor network conditions for all sessions **");
  for (const auto& [key, session] : _sessions) session->noteBadNetworkConditions();
}

void ZalLoggingAgentServer::forceNetworkDump() {
  const std::string directory = ZalLoggingAgentVistelSession::logPathForDate(
      _sessionServices, _platform.clock.wallNow(),
      _platform.configuration.roots.DiagnosticReportRoot + "/Vistel", false);
  // One that cannot be made is the dump's own affair: it says what it could not write.
  _platform.files.makeDirectories(directory);
  _hooks.ForceNetworkDump(directory, true);
  _notePoorNetworkConditions();
  _noteActivity();
}

}  // namespace zal
