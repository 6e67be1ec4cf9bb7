#include <filesystem>
#include <memory>
#include <system_error>
#include <utility>
#include <vector>

#include "collectors/file_collector.h"
#include "collectors/rotated_log_sets.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "platform/session_records.h"
#include "platform/standard_path.h"
#include "session/collected_files.h"
#include "session/date_text.h"
#include "session/header_lines.h"
#include "session/session_lines.h"
#include "session/session_log_writing.h"
#include "session/session_writings.h"
#include "session/vistel_session.h"

namespace zal {

namespace {

/// A log of fewer lines says nothing but that there was a session.
constexpr std::size_t kFewestLines = 4;

/// What waits for the disk would hold the main thread for as long as that takes.
void runElsewhere(const SessionLogWriting::File& part, SessionServices& services,
                  const SessionWritings::Finish& finish) {
  if (services.writings == nullptr) return finish(part());
  const std::vector<SessionLogWriting::File> parts{part};
  services.writings->begin(std::make_shared<SessionLogWriting>(parts, services.agentLog), finish);
}

void placeCollectedFiles(const std::shared_ptr<CollectedFilesMove>& files, SessionServices& services,
                         const SessionWritings::Finish& finish) {
  if (files->moveWithinFileSystem()) return finish(true);
  const SessionLogWriting::File moveRest = [files] {
    files->moveRest();
    return true;
  };
  runElsewhere(moveRest, services, finish);
}

/// One that is left stays: perhaps the disk takes the files at the next start.
void removeRecord(SessionRecord* record, const std::string& writtenInto, SessionServices& services,
                  const SessionWritings::Finish& finish) {
  if (record == nullptr) return finish(true);
  const SessionLogWriting::File remove = [removal = record->removal(writtenInto)] {
    removal();
    return true;
  };
  runElsewhere(remove, services, finish);
}

}  // namespace

const std::string& ZalLoggingAgentVistelSession::_timeZoneAbbreviation(const SessionServices& services) {
  return services.timeZone.abbreviation(services.clock);
}

std::string ZalLoggingAgentVistelSession::logStringForDate(const SessionServices& services, WallTime date) {
  return sessionDateText(services.clock.localTime(date)) + " (" + _timeZoneAbbreviation(services) + ")";
}

std::string ZalLoggingAgentVistelSession::logPathForDate(const SessionServices& services, WallTime date,
                                                         std::string_view basePath, bool isInitiator) {
  const std::string joined = std::string(basePath) + "/" + logStringForDate(services, date) +
                             (isInitiator ? " (Initiator)" : " (Receiver)");
  return standardizeBelowRoot(joined, services.roots.DiagnosticReportRoot, services.files.homeDirectory());
}

void ZalLoggingAgentVistelSession::writeSessionLog(bool endedByEndAll) {
  _mainThread.check("ZalLoggingAgentVistelSession");
  AgentLog& log = _services.agentLog;
  if (!_wasCutOff && !_logs.anyHas(kFewestLines)) {
    log.log("Logging", "No logs to write, bailing");
    return;
  }
  if (!_dateStarted) {
    log.console("", "Cannot write session log: we never started!");
    return;
  }
  if (hasControlCharacters(_logBasePath)) {
    log.warning("Refused to write into \"" + printable(_logBasePath) +
                "\": its name holds control characters");
    _isWritten = false;
    return;
  }

  const std::string directory = logPathForDate(_services, *_dateStarted, _logBasePath, _initiator);
  // A failure shows in the files that cannot be written then.
  _services.files.makeDirectories(directory);
  const std::string fileEnding = "Log (" + fileTimeText(_services.clock.localTime(*_dateStarted)) + ").log";
  LinkRecentLogSets(_services.fileCollector, _services.roots, log, {_sessionType}, directory);

  const std::optional<std::string> recovered = headerLine("Recovered", _recoveryNote);
  _header = std::make_shared<HeaderLines>(_logCheckpoints || _logDescriptions ? &log : nullptr);
  if (recovered) _header->addTimed(*recovered);
  _addTimeInformation();
  _addCallInfoInformation();
  _addBuildInformation();
  _addFailureInformation();
  _addRecipientInformation();
  _addInitiatorInformation();
  if (recovered) _header->addQuality(*recovered);

  const bool areLarge = _logs.areLarge();
  const SessionLogs::Taken logs = _logs.take(directory, fileEnding, std::exchange(_header, nullptr));
  const auto close = [&services = _services, directory, record = _recorder.release(),
                      collection = _collection(directory, endedByEndAll)](bool isWritten) {
    removeRecord(isWritten ? record.get() : nullptr, directory, services, [&services, collection](bool) {
      if (services.CollectServiceLogs) services.CollectServiceLogs(collection);
    });
  };
  const auto files =
      std::make_shared<CollectedFilesMove>(_filesToCollect, directory, _services.fileCollector, log);
  const auto finish = [&services = _services, hold = logs.hold, files, close](bool isWritten) {
    hold->release(hold->bytes());
    placeCollectedFiles(files, services, [close, isWritten](bool isPlaced) { close(isWritten && isPlaced); });
  };
  if (_services.writings == nullptr) {
    _isWritten = logs.writing->run();
    return finish(_isWritten);
  }
  _services.writings->begin(logs.writing, finish);
  // The end of all of them is over when it returns, but for what would take longer than the main thread has.
  if (endedByEndAll && !areLarge) _services.writings->finishAll();
}

CollectionRequest ZalLoggingAgentVistelSession::_collection(const std::string& directory,
                                                            bool endedByEndAll) const {
  CollectionRequest request{_sessionType, directory, std::nullopt, !endedByEndAll, _endFlags, endedByEndAll};
  const auto reason = failureReason();
  if (!isEmptyText(reason)) request.reason = _sessionType + " - " + *reason;
  return request;
}

}  // namespace zal
