// Requests that one open session answers.

#include "agent/zal_logging_agent_server.h"

namespace zal {

/// The session that an entry of that type goes to; none while call logging is off.
ZalLoggingAgentServer::Session ZalLoggingAgentServer::_openSession(OptionalText type) {
  _mainThread.check("ZalLoggingAgentServer");
  return _switches.isCallLoggingEnabled() ? _sessionForSessionType(type, false) : nullptr;
}

void ZalLoggingAgentServer::pulseForSession(OptionalText type, OptionalText sender) {
  if (const Session session = _openSession(type)) session->pulseFromSender(sender);
}

void ZalLoggingAgentServer::noteCheckpoint(OptionalText checkpoint, OptionalText type, double checkpointTime,
                                           OptionalText sender) {
  if (const Session session = _openSession(type)) session->noteCheckpoint(checkpoint, checkpointTime, sender);
}

void ZalLoggingAgentServer::logDescription(OptionalText description, OptionalText log, OptionalText type,
                                           OptionalText sender, double time) {
  if (const Session session = _openSession(type)) session->logDescription(description, log, sender, time);
}

void ZalLoggingAgentServer::logCallInfo(OptionalText info, OptionalText category, OptionalText type,
                                        OptionalText sender) {
  if (const Session session = _openSession(type)) session->logCallInfo(info, category, sender);
}

void ZalLoggingAgentServer::addCallMetric(OptionalText description, std::optional<Number> value,
                                          OptionalText type, OptionalText sender) {
  if (const Session session = _openSession(type)) session->logQualityMetric(description, value, sender);
}

void ZalLoggingAgentServer::addLogFile(OptionalText path, OptionalText type, OptionalText sender,
                                       OptionalText category) {
  if (const Session session = _openSession(type)) session->addLogFile(path, sender, category);
}

void ZalLoggingAgentServer::logCallQuality(OptionalText description, OptionalText log, OptionalText type,
                                           OptionalText sender) {
  if (const Session session = _openSession(type)) session->logQualityCategory(description, log, sender);
}

void ZalLoggingAgentServer::noteFailureReason(OptionalText reason, OptionalText type,
                                              OptionalText /*sender*/) {
  if (const Session session = _openSession(type)) session->setFailureReason(reason);
}

void ZalLoggingAgentServer::noteInitiator(OptionalText initiator, OptionalText type,
                                          OptionalText /*sender*/) {
  if (const Session session = _openSession(type)) session->setInitiator(initiator);
}

void ZalLoggingAgentServer::noteReceiver(OptionalText receiver, OptionalText type, OptionalText /*sender*/) {
  if (const Session session = _openSession(type)) session->setRecipient(receiver);
}

void ZalLoggingAgentServer::noteEvent(std::int64_t /*event*/, OptionalText /*type*/,
                                      OptionalText /*sender*/) {}

}  // namespace zal
