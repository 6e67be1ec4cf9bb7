#include "platform/agent_log.h"
#include "session/session_lines.h"
#include "session/vistel_session.h"

namespace zal {

namespace {
constexpr std::string_view kNoInfo = "No Info";
constexpr std::string_view kNoDescription = "No Description";
constexpr std::string_view kDefaultFileCategory = "Collected Files";
}  // namespace

void ZalLoggingAgentVistelSession::noteCheckpoint(OptionalText checkpoint, double checkpointTime,
                                                  OptionalText sender) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  _beginUnlessActive(sender);
  const std::string line =
      checkpointLine(checkpoint, sender, _entryTime(wallTimeFromSeconds(checkpointTime)));
  if (_logCheckpoints) _services.agentLog.notice(echoOf(line));
  _simpleLogs.addLog(line, checkpointTime);
  _verboseLogs.addLog(line, checkpointTime);
  _markActive();
}

void ZalLoggingAgentVistelSession::logDescription(OptionalText description, OptionalText log,
                                                  OptionalText sender, double time) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  const std::string_view name = textOr(sender, kNoSender);
  _beginUnlessActive(name);
  const std::string line = descriptionLine(description, log, name, _entryTime(wallTimeFromSeconds(time)));
  if (_logDescriptions) _services.agentLog.notice(echoOf(line));
  _verboseLogs.addLog(line, time);
  _markActive();
}

void ZalLoggingAgentVistelSession::logQualityCategory(OptionalText category, OptionalText log,
                                                      OptionalText sender) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  const std::string_view name = textOr(sender, kNoSender);
  _beginUnlessActive(name);
  const std::string line = descriptionLine(category, log, name, _entryTime(_services.clock.wallNow()));
  if (_logDescriptions) _services.agentLog.notice(echoOf(line));
  _qualityLogs.append(line);
  _markActive();
}

void ZalLoggingAgentVistelSession::logCallInfo(OptionalText value, OptionalText category,
                                               OptionalText sender) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  _beginUnlessActive(textOr(sender, kNoSender));
  _addCallInfo(value, category);
  _markActive();
}

void ZalLoggingAgentVistelSession::logQualityMetric(OptionalText name, std::optional<Number> value,
                                                    OptionalText sender) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  if (!name || !value) return;  // not worth a session
  const std::string_view shown = textOr(sender, kNoSender);
  _beginUnlessActive(shown);
  _addQualityMetric(name, value, shown);
  _markActive();
}

void ZalLoggingAgentVistelSession::addLogFile(OptionalText path, OptionalText /*sender*/,
                                              OptionalText category) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  if (!path) return;
  // Only an absent category has a name of its own; an empty one means the session directory itself.
  _filesToCollect[std::string(category.value_or(kDefaultFileCategory))].emplace(*path);
}

void ZalLoggingAgentVistelSession::_beginUnlessActive(OptionalText sender) {
  if (!_active) beginSessionWithSender(sender);
}

void ZalLoggingAgentVistelSession::_addCallInfo(OptionalText value, OptionalText category) {
  _callInfoCategories.emplace_back(textOr(category, kNoDescription));
  _callInfoStrings.emplace_back(textOr(value, kNoInfo));
}

}  // namespace zal
