#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/clock.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"
#include "platform/value.h"
#include "session/collected_files.h"
#include "session/entry_time_text.h"
#include "session/optional_text.h"
#include "session/session_entry.h"
#include "session/session_logs.h"
#include "session/session_recorder.h"
#include "session/session_services.h"

namespace zal {

/// How long a session may hear nothing before it reports itself inactive: clients that died during
/// a call cannot end it.
inline constexpr std::chrono::milliseconds kSessionInactivityLimit{240'000};
/// Distance of the signal samples that an active session takes.
inline constexpr std::chrono::milliseconds kQualityPulseInterval{5'000};
/// Posted with the session as its object.
inline constexpr std::string_view kSessionBecameInactive = "LirraLogSessionBecameInactiveNotification";

/// One logging session: what clients report of a call, until its end turns it into three log files
/// in a dated directory. Ended sessions can begin again and keep their metrics, call information,
/// files and identities. Any entry begins a session that is not active. Nothing here fails towards
/// the caller. Main thread only. Owned by shared_ptr; an observer of the inactivity notification may
/// drop its reference while it is being told.
///
///     auto session = std::make_shared<ZalLoggingAgentVistelSession>("Vistel", "~/reports/Vistel", services);
///     session->beginSessionWithSender("caller");
///     session->noteCheckpoint("Connected", 1714651387.25, "caller");
///     session->endSessionWithSender("caller");
class ZalLoggingAgentVistelSession : public std::enable_shared_from_this<ZalLoggingAgentVistelSession> {
 public:
  /// The directory gets one subdirectory per session; a leading "~" is the user's home.
  ZalLoggingAgentVistelSession(std::string sessionType, std::string logDirectory, SessionServices& services);
  /// Its record goes with it once it was ended.
  ~ZalLoggingAgentVistelSession();
  ZalLoggingAgentVistelSession(const ZalLoggingAgentVistelSession&) = delete;
  ZalLoggingAgentVistelSession& operator=(const ZalLoggingAgentVistelSession&) = delete;

  void beginSessionWithSender(OptionalText sender);
  /// The sender "ENDALL" makes the collection after it run at once instead of in the background.
  void endSessionWithSender(OptionalText sender);
  /// A sign of life; nothing is written.
  void pulseFromSender(OptionalText sender);
  /// A hook for sessions that care; this one does not.
  void noteBadNetworkConditions() {}

  // Entries. Times are seconds since 1970.
  void noteCheckpoint(OptionalText checkpoint, double checkpointTime, OptionalText sender);
  void logDescription(OptionalText description, OptionalText log, OptionalText sender, double time);
  void logQualityCategory(OptionalText category, OptionalText log, OptionalText sender);
  void logCallInfo(OptionalText value, OptionalText category, OptionalText sender);
  /// Ignored whole when the name or the value is absent.
  void logQualityMetric(OptionalText name, std::optional<Number> value, OptionalText sender);
  /// Moved beside the log files when they are written, into a subdirectory named by the category: an
  /// absent one is "Collected Files", an empty one the session directory itself.
  void addLogFile(OptionalText path, OptionalText sender, OptionalText category);

  // A session of a process that was cut off, from its record. The services have no black box then.
  /// Stands as "[Recovered: note]" at the top of every log that is written.
  void setRecoveryNote(std::string note) { _recoveryNote = std::move(note); }
  /// Takes an entry as of the moment at which it was taken first.
  void replay(const SessionEntry& entry);
  /// Ends the session if its record did not; then it is written however few lines it has. Returned:
  /// whether all that was to be written is in its files.
  bool endReplay(WallTime moment);

  /// Starts the ping tests of a call and adds their result files to the session's.
  void startPing(bool useWifi);

  /// The device model, or nothing when the host has none.
  [[nodiscard]] std::optional<std::string> model();
  /// Writes and empties the logs; does nothing but log while all have fewer than four lines. Where the
  /// services have writings the files are there later, and what follows them follows then; when all sessions
  /// end, only those of a large one.
  void writeSessionLog(bool endedByEndAll);

  /// Where the files of a session that started at that moment go: absolute, without dots, and without links
  /// down to the report root. One below that shows when it is written.
  [[nodiscard]] static std::string logPathForDate(const SessionServices& services, WallTime date,
                                                  std::string_view basePath, bool isInitiator);
  /// The same moment as a directory name without a role.
  [[nodiscard]] static std::string logStringForDate(const SessionServices& services, WallTime date);

  [[nodiscard]] bool isActive() const { return _active; }
  [[nodiscard]] const std::string& sessionType() const { return _sessionType; }
  [[nodiscard]] bool logCheckpointsToConsole() const { return _logCheckpoints; }
  void setLogCheckpointsToConsole(bool enabled) { _logCheckpoints = enabled; }
  [[nodiscard]] bool logDescriptionsToConsole() const { return _logDescriptions; }
  void setLogDescriptionsToConsole(bool enabled) { _logDescriptions = enabled; }
  [[nodiscard]] bool isInitiator() const { return _initiator; }
  void setIsInitiator(bool initiator) { _accept({.kind = SessionEntryKind::role, .value = initiator}); }
  [[nodiscard]] std::uint32_t endFlags() const { return _endFlags; }
  void setEndFlags(std::uint32_t flags) { _endFlags = flags; }

  // Copied whole on both ways; any thread, but where there is a black box they are set on the main thread.
  // Absent when never set or set to nothing.
  [[nodiscard]] std::optional<std::string> failureReason() const { return _property(_failureReason); }
  void setFailureReason(OptionalText reason) {
    _take(_failureReason, {.kind = SessionEntryKind::failureReason, .text = reason});
  }
  [[nodiscard]] std::optional<std::string> initiator() const { return _property(_initiatorID); }
  void setInitiator(OptionalText initiator) {
    _take(_initiatorID, {.kind = SessionEntryKind::initiator, .text = initiator});
  }
  [[nodiscard]] std::optional<std::string> recipient() const { return _property(_recipientID); }
  void setRecipient(OptionalText recipient) {
    _take(_recipientID, {.kind = SessionEntryKind::recipient, .text = recipient});
  }

 private:
  void _accept(SessionEntry entry);
  void _take(std::optional<std::string>& field, const SessionEntry& entry);
  void _note(const SessionEntry& entry);
  void _noteWhatIsKept(WallTime now);
  void _carryOut(const SessionEntry& entry);

  void _begin(OptionalText sender, WallTime now);
  void _end(OptionalText sender, WallTime now);
  void _markActive();
  void _cancelInactivityTimer();
  void _postInactive();

  /// Valid until the next call.
  [[nodiscard]] std::string_view _entryTime(WallTime moment);
  void _beginUnlessActive(OptionalText sender, WallTime now);
  void _addCheckpoint(const SessionEntry& entry);
  void _addDescription(const SessionEntry& entry);
  void _addQuality(const SessionEntry& entry);
  void _addCallInfo(OptionalText value, OptionalText category);
  void _addFile(OptionalText path, OptionalText category);

  [[nodiscard]] std::vector<std::string> _storedMetrics() const;
  [[nodiscard]] std::vector<Number>& _metricsForKey(std::string_view name);
  void _addQualityMetric(const SessionEntry& entry);
  void _appendQualityMetrics();
  void _gatherQualityMetrics();

  void _addHeaderLine(OptionalText label, OptionalText value);
  void _addTimeInformation();
  void _addCallInfoInformation();
  void _addBuildInformation();
  void _addFailureInformation();
  void _addRecipientInformation();
  void _addInitiatorInformation();
  [[nodiscard]] CollectionRequest _collection(const std::string& directory, bool endedByEndAll) const;
  [[nodiscard]] static const std::string& _timeZoneAbbreviation(const SessionServices& services);

  [[nodiscard]] std::optional<std::string> _property(const std::optional<std::string>& field) const;
  void _setProperty(std::optional<std::string>& field, OptionalText text);

  SessionServices& _services;
  std::optional<WallTime> _dateStarted;
  std::optional<WallTime> _dateEnded;
  std::string _logBasePath;
  std::string _sessionType;
  std::optional<std::string> _initiatorID, _recipientID, _failureReason;  // under the property lock
  mutable std::mutex _propertyLock;
  std::optional<std::string> _model;
  SessionLogs _logs;
  std::shared_ptr<HeaderLines> _header;                            // while they are being written
  std::vector<std::string> _callInfoCategories, _callInfoStrings;  // parallel
  std::map<std::string, std::vector<Number>, std::less<>> _qualityMetrics;
  FilesByCategory _filesToCollect;
  SessionRecorder _recorder;
  std::optional<std::string> _recoveryNote;
  bool _wasCutOff = false;
  bool _isWritten = true;
  EntryTimeText _dateFormatter;
  bool _initiator = false;
  bool _active = false;
  bool _logCheckpoints = false;
  bool _logDescriptions = false;
  std::uint32_t _endFlags = 0;
  MainThreadCheck _mainThread;
  ScopedTimer _qualityPulse;
  std::shared_ptr<bool> _pulseIsOn;  // there from begin to end: answers to its questions look for it
  ScopedTimer _inactivity;
};

}  // namespace zal
