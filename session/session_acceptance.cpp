// The one way by which entries come into a session, from a client or from the black box.

#include <utility>

#include "session/session_lines.h"
#include "session/vistel_session.h"

namespace zal {

namespace {
constexpr std::string_view kSenderRecovered = "RECOVERED";
}  // namespace

/// Everything that the session takes is noted before anything comes of it, as of the moment that its
/// lines carry: taken again it gives the same lines.
void ZalLoggingAgentVistelSession::_accept(SessionEntry entry) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  entry.at = _services.clock.wallNow();
  _note(entry);
  _carryOut(entry);
}

void ZalLoggingAgentVistelSession::_note(const SessionEntry& entry) {
  // With nothing to write there is nothing to recover either.
  if (_recorder.needsRecord() && entry.kind != SessionEntryKind::end) {
    _recorder.open(entry.at);
    _noteWhatIsKept(entry.at);
  }
  _recorder.note(entry);
}

void ZalLoggingAgentVistelSession::_noteWhatIsKept(WallTime now) {
  const auto noteText = [&](SessionEntryKind kind, const std::optional<std::string>& text) {
    if (text) _recorder.note({.kind = kind, .at = now, .text = *text});
  };
  noteText(SessionEntryKind::initiator, initiator());
  noteText(SessionEntryKind::recipient, recipient());
  noteText(SessionEntryKind::failureReason, failureReason());
  if (_initiator) _recorder.note({.kind = SessionEntryKind::role, .at = now, .value = true});
  for (std::size_t item = 0; item < _callInfoCategories.size(); ++item) {
    _recorder.note({.kind = SessionEntryKind::keptCallInfo,
                    .at = now,
                    .text = _callInfoStrings[item],
                    .log = _callInfoCategories[item]});
  }
  for (const auto& [name, values] : _qualityMetrics) {
    for (const Number& value : values) {
      _recorder.note({.kind = SessionEntryKind::keptMetric, .at = now, .text = name, .value = value});
    }
  }
  for (const auto& [category, paths] : _filesToCollect) {
    for (const std::string& path : paths) {
      _recorder.note({.kind = SessionEntryKind::file, .at = now, .text = path, .log = category});
    }
  }
}

void ZalLoggingAgentVistelSession::_carryOut(const SessionEntry& entry) {
  switch (entry.kind) {
    case SessionEntryKind::opened:
      return;
    case SessionEntryKind::begin:
      return _begin(entry.sender, entry.at);
    case SessionEntryKind::end:
      return _end(entry.sender, entry.at);
    case SessionEntryKind::checkpoint:
      return _addCheckpoint(entry);
    case SessionEntryKind::description:
      return _addDescription(entry);
    case SessionEntryKind::quality:
      return _addQuality(entry);
    case SessionEntryKind::metric:
      _addQualityMetric(entry);
      return _markActive();
    case SessionEntryKind::sample:
      return _addQualityMetric(entry);
    case SessionEntryKind::callInfo:
      _beginUnlessActive(textOr(entry.sender, kNoSender), entry.at);
      _addCallInfo(entry.text, entry.log);
      return _markActive();
    case SessionEntryKind::file:
      return _addFile(entry.text, entry.log);
    case SessionEntryKind::initiator:
      return _setProperty(_initiatorID, entry.text);
    case SessionEntryKind::recipient:
      return _setProperty(_recipientID, entry.text);
    case SessionEntryKind::failureReason:
      return _setProperty(_failureReason, entry.text);
    case SessionEntryKind::role:
      _initiator = entry.value == Number(true);
      return;
    case SessionEntryKind::keptCallInfo:
      return _addCallInfo(entry.text, entry.log);
    case SessionEntryKind::keptMetric:
      if (entry.text && entry.value) _metricsForKey(*entry.text).push_back(*entry.value);
      return;
  }
}

void ZalLoggingAgentVistelSession::_take(std::optional<std::string>& field, const SessionEntry& entry) {
  if (!_recorder.isRecording()) return _setProperty(field, entry.text);  // on any thread
  _accept(entry);
}

void ZalLoggingAgentVistelSession::replay(const SessionEntry& entry) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  _carryOut(entry);
}

bool ZalLoggingAgentVistelSession::endReplay(WallTime moment) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  if (_active) {
    _wasCutOff = true;
    _end(kSenderRecovered, moment);
  }
  return _isWritten;
}

}  // namespace zal
