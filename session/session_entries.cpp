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
  _accept(
      {.kind = SessionEntryKind::checkpoint, .text = checkpoint, .sender = sender, .time = checkpointTime});
}

void ZalLoggingAgentVistelSession::_addCheckpoint(const SessionEntry& entry) {
  _beginUnlessActive(entry.sender, entry.at);
  const std::string line =
      checkpointLine(entry.text, entry.sender, _entryTime(wallTimeFromSeconds(entry.time)));
  if (_logCheckpoints) _services.agentLog.notice(echoOf(line));
  _logs.addCheckpoint(line, entry.time);
  _markActive();
}

void ZalLoggingAgentVistelSession::logDescription(OptionalText description, OptionalText log,
                                                  OptionalText sender, double time) {
  _accept({.kind = SessionEntryKind::description,
           .text = description,
           .log = log,
           .sender = sender,
           .time = time});
}

void ZalLoggingAgentVistelSession::_addDescription(const SessionEntry& entry) {
  const std::string_view name = textOr(entry.sender, kNoSender);
  _beginUnlessActive(name, entry.at);
  const std::string line =
      descriptionLine(entry.text, entry.log, name, _entryTime(wallTimeFromSeconds(entry.time)));
  if (_logDescriptions) _services.agentLog.notice(echoOf(line));
  _logs.addDescription(line, entry.time);
  _markActive();
}

void ZalLoggingAgentVistelSession::logQualityCategory(OptionalText category, OptionalText log,
                                                      OptionalText sender) {
  _accept({.kind = SessionEntryKind::quality, .text = category, .log = log, .sender = sender});
}

void ZalLoggingAgentVistelSession::_addQuality(const SessionEntry& entry) {
  const std::string_view name = textOr(entry.sender, kNoSender);
  _beginUnlessActive(name, entry.at);
  const std::string line = descriptionLine(entry.text, entry.log, name, _entryTime(entry.at));
  if (_logDescriptions) _services.agentLog.notice(echoOf(line));
  _logs.addQuality(line);
  _markActive();
}

void ZalLoggingAgentVistelSession::logCallInfo(OptionalText value, OptionalText category,
                                               OptionalText sender) {
  _accept({.kind = SessionEntryKind::callInfo, .text = value, .log = category, .sender = sender});
}

void ZalLoggingAgentVistelSession::logQualityMetric(OptionalText name, std::optional<Number> value,
                                                    OptionalText sender) {
  if (!name || !value) return;  // not worth a session
  _accept({.kind = SessionEntryKind::metric, .text = name, .sender = sender, .value = value});
}

void ZalLoggingAgentVistelSession::addLogFile(OptionalText path, OptionalText /*sender*/,
                                              OptionalText category) {
  if (!path) return;
  _accept({.kind = SessionEntryKind::file, .text = path, .log = category});
}

void ZalLoggingAgentVistelSession::_addFile(OptionalText path, OptionalText category) {
  if (!path) return;
  // Only an absent category has a name of its own; an empty one means the session directory itself.
  _filesToCollect[std::string(category.value_or(kDefaultFileCategory))].emplace(*path);
}

void ZalLoggingAgentVistelSession::_beginUnlessActive(OptionalText sender, WallTime now) {
  if (!_active) _begin(sender, now);
}

void ZalLoggingAgentVistelSession::_addCallInfo(OptionalText value, OptionalText category) {
  _callInfoCategories.emplace_back(textOr(category, kNoDescription));
  _callInfoStrings.emplace_back(textOr(value, kNoInfo));
}

}  // namespace zal
