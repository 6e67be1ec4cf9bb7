#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/clock.h"
#include "platform/value.h"
#include "session/optional_text.h"
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

  /// Starts the ping tests of a call and adds their result files to the session's.
  void startPing(bool useWifi);

  /// The device model, or nothing when the host has none.
  [[nodiscard]] std::optional<std::string> model();
  /// Writes and empties the line lists; does nothing but log while all have fewer than four lines.
  void writeSessionLog(bool endedByEndAll);

  /// Where the files of a session that started at that moment go: absolute, without links or dots.
  [[nodiscard]] static std::string logPathForDate(const SessionServices& services, WallTime date,
                                                  std::string_view basePath, bool isInitiator);
  /// The same moment as a directory name without a role.
  [[nodiscard]] static std::string logStringForDate(const SessionServices& services, WallTime date);

  [[nodiscard]] bool isActive() const;
  [[nodiscard]] const std::string& sessionType() const;
  [[nodiscard]] bool logCheckpointsToConsole() const;
  void setLogCheckpointsToConsole(bool enabled);
  [[nodiscard]] bool logDescriptionsToConsole() const;
  void setLogDescriptionsToConsole(bool enabled);
  [[nodiscard]] bool isInitiator() const;
  void setIsInitiator(bool initiator);
  [[nodiscard]] std::uint32_t endFlags() const;
  void setEndFlags(std::uint32_t flags);

  // Copied whole on both ways; any thread. Absent when never set or set to nothing.
  [[nodiscard]] std::optional<std::string> failureReason() const;
  void setFailureReason(OptionalText reason);
  [[nodiscard]] std::optional<std::string> initiator() const;
  void setInitiator(OptionalText initiator);
  [[nodiscard]] std::optional<std::string> recipient() const;
  void setRecipient(OptionalText recipient);

 private:
  struct State;
  std::unique_ptr<State> _state;
};

}  // namespace zal
