#include "session/vistel_session.h"

#include <utility>

#include "platform/agent_log.h"
#include "platform/local_notifications.h"
#include "session/session_lines.h"

namespace zal {

namespace {
constexpr std::string_view kEndAllSender = "ENDALL";
constexpr std::string_view kForcedEnd = "FORCE: ";
}  // namespace

ZalLoggingAgentVistelSession::ZalLoggingAgentVistelSession(std::string sessionType, std::string logDirectory,
                                                           SessionServices& services)
    : _services(services),
      _logBasePath(std::move(logDirectory)),
      _sessionType(std::move(sessionType)),
      _logs(services),
      _recorder(services.sessionRecords, _sessionType),
      _dateFormatter(services.clock, services.timeZone) {}

ZalLoggingAgentVistelSession::~ZalLoggingAgentVistelSession() {
  if (!_active) _recorder.remove();
}

void ZalLoggingAgentVistelSession::beginSessionWithSender(OptionalText sender) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  if (_active) {
    endSessionWithSender(std::string(kForcedEnd).append(sender.value_or("")));
    // The end wrote already, unless there was too little: then this says so, and what there is goes
    // on into the new session.
    writeSessionLog(false);
  }
  _accept({.kind = SessionEntryKind::begin, .sender = sender});
}

void ZalLoggingAgentVistelSession::_begin(OptionalText sender, WallTime now) {
  _dateStarted = now;
  _active = true;
  const std::string line = beginLine(sender.value_or(""), _entryTime(now));
  if (_logCheckpoints) _services.agentLog.notice(echoOf(line));
  _logs.addCheckpoint(line, secondsSinceEpoch(now));
  if (!_qualityPulse.isSet()) {
    _pulseIsOn = std::make_shared<bool>(true);
    _qualityPulse =
        ScopedTimer(_services.mainLoop,
                    _services.mainLoop.callEvery(kQualityPulseInterval, [this] { _gatherQualityMetrics(); }));
  }
  _markActive();
}

void ZalLoggingAgentVistelSession::endSessionWithSender(OptionalText sender) {
  _accept({.kind = SessionEntryKind::end, .sender = sender});
}

void ZalLoggingAgentVistelSession::_end(OptionalText sender, WallTime now) {
  _qualityPulse.cancel();
  _pulseIsOn.reset();
  _dateEnded = now;
  _active = false;
  if (!_logs.hasTimedLines()) {
    _cancelInactivityTimer();
    return;
  }
  const std::string line = endLine(sender.value_or(""), _entryTime(now));
  if (_logCheckpoints) _services.agentLog.notice(echoOf(line));
  _logs.addCheckpoint(line, secondsSinceEpoch(now));
  _logs.addQuality(line);
  _appendQualityMetrics();
  writeSessionLog(sender == kEndAllSender);
  _cancelInactivityTimer();
}

void ZalLoggingAgentVistelSession::pulseFromSender(OptionalText /*sender*/) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  _markActive();
}

void ZalLoggingAgentVistelSession::_markActive() {
  _cancelInactivityTimer();
  _inactivity = ScopedTimer(
      _services.mainLoop, _services.mainLoop.callAfter(kSessionInactivityLimit, [this] { _postInactive(); }));
}

void ZalLoggingAgentVistelSession::_cancelInactivityTimer() { _inactivity.cancel(); }

void ZalLoggingAgentVistelSession::_postInactive() {
  // Who is told may drop the last reference to this object.
  const auto self = weak_from_this().lock();
  _cancelInactivityTimer();
  _services.localNotifications.post(kSessionBecameInactive, this);
}

std::string_view ZalLoggingAgentVistelSession::_entryTime(WallTime moment) {
  return _dateFormatter.text(moment);
}

std::optional<std::string> ZalLoggingAgentVistelSession::_property(
    const std::optional<std::string>& field) const {
  const std::scoped_lock lock(_propertyLock);
  return field;
}

void ZalLoggingAgentVistelSession::_setProperty(std::optional<std::string>& field, OptionalText text) {
  std::optional<std::string> copy;
  if (text) copy.emplace(*text);
  const std::scoped_lock lock(_propertyLock);
  field.swap(copy);
}

}  // namespace zal
