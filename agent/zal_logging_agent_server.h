#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "agent/agent_hooks.h"
#include "agent/agent_log_record.h"
#include "agent/logging_switches.h"
#include "platform/main_thread_check.h"
#include "platform/platform.h"
#include "session/session_services.h"
#include "session/vistel_session.h"
#include "session/zal_pair.h"

namespace zal {

/// How long the agent stays without anything to do: distance of the checks and threshold in one.
inline constexpr std::chrono::milliseconds kInactivityLimit{360'000};
/// An ended session stays open this long, for what its clients still have to say.
inline constexpr std::chrono::milliseconds kDelayedEndInterval{3'000};
inline constexpr std::string_view kListenerServiceName = "com.vendel.lirra";

/// Bits of a begin request that the server itself looks at.
inline constexpr std::int64_t kBeginFlagInitiator = 4;

/// The one object that all requests end at: owns the listener and the registry of open sessions,
/// records what clients log, and ends the process after six idle minutes. Requests are never
/// refused with an error: absent texts take defaults, unknown sessions and switched-off call logging
/// make an operation do nothing. Main thread only; the platform and the sessions' services outlive it.
class ZalLoggingAgentServer : public ActionServer {
 public:
  using Sessions = std::map<std::string, std::shared_ptr<ZalLoggingAgentVistelSession>>;

  /// The server of this process, made at the first call after lendPlatform(); null when it cannot
  /// be made (logged). It is never destroyed: the process ends under it.
  static ZalLoggingAgentServer* sharedInstance();
  /// What the shared server will be built from; before the first sharedInstance().
  static void lendPlatform(Platform& platform, SessionServices& sessionServices, AgentHooks hooks = {});
  /// Forgets server, platform, hooks and observer, as if the process had just started.
  static void resetSharedInstanceForTests();

  ZalLoggingAgentServer(Platform& platform, SessionServices& sessionServices, AgentHooks hooks);
  ~ZalLoggingAgentServer() override;
  ZalLoggingAgentServer(const ZalLoggingAgentServer&) = delete;
  ZalLoggingAgentServer& operator=(const ZalLoggingAgentServer&) = delete;

  /// Opens the listener, once; every call counts as activity.
  void start();
  /// Ends all sessions in place, and waits for their files.
  void stop();
  /// Ends the process if it was idle for longer than the limit, else waits for another limit.
  void terminate();
  [[nodiscard]] bool isRunning() const { return true; }

  /// Returned: LoggingSwitches::read().
  bool readLoggingPreferences();

  // Session operations: docs of the entries are the session's own.
  void beginSession(OptionalText type, OptionalText sender, std::int64_t beginSessionFlags,
                    std::int64_t endSessionFlags);
  void endSession(OptionalText type, OptionalText sender);
  void endSession(OptionalText type, OptionalText sender, bool endNow);
  void pulseForSession(OptionalText type, OptionalText sender);
  void noteCheckpoint(OptionalText checkpoint, OptionalText type, double checkpointTime, OptionalText sender);
  void logDescription(OptionalText description, OptionalText log, OptionalText type, OptionalText sender,
                      double time);
  void logCallInfo(OptionalText info, OptionalText category, OptionalText type, OptionalText sender);
  void addCallMetric(OptionalText description, std::optional<Number> value, OptionalText type,
                     OptionalText sender);
  void addLogFile(OptionalText path, OptionalText type, OptionalText sender, OptionalText category);
  void logCallQuality(OptionalText description, OptionalText log, OptionalText type, OptionalText sender);
  void noteFailureReason(OptionalText reason, OptionalText type, OptionalText sender);
  void noteInitiator(OptionalText initiator, OptionalText type, OptionalText sender);
  void noteReceiver(OptionalText receiver, OptionalText type, OptionalText sender);
  /// Does nothing: events of sessions are accepted and dropped.
  void noteEvent(std::int64_t event, OptionalText type, OptionalText sender);
  /// Ends every session with the sender "ENDALL"; they stay registered.
  void endAllSessions();
  /// Takes a network dump into a fresh directory beside the sessions of video calls.
  void forceNetworkDump();

  // Records for the host logging facility; an empty text is no record and no activity.
  void log(const AgentLogRecord& record);
  void event(const AgentLogRecord& record);

  /// Notes activity, has the action carried out, notes activity. Peer, request and user info may be
  /// absent.
  void performAction(std::int64_t action, OptionalText session, OptionalText sender,
                     const std::shared_ptr<PeerConnection>& peer, const Message* request,
                     const ValueMap* userInfo);

  // What actions ask of the server.
  void notePoorNetworkConditions() override { _notePoorNetworkConditions(); }
  void startPing(OptionalText sessionType, bool useWifi) override;
  void setAutomationRunning(bool running) override { _automationRunning = running; }
  /// Does nothing: a dump is over when its alert is posted.
  void userNotificationDidFinish() override {}

  // What the server is at this moment.
  [[nodiscard]] const Sessions& sessions() const { return _sessions; }
  [[nodiscard]] const LoggingSwitches& switches() const { return _switches; }
  [[nodiscard]] std::optional<SteadyTime> lastActivity() const { return _lastActivity; }
  [[nodiscard]] bool isInactivityTimerPending() const { return _pendingInactivityTimer; }

 private:
  using Session = std::shared_ptr<ZalLoggingAgentVistelSession>;
  using EndRequest = ZalPair<std::string, std::optional<std::string>>;  ///< type as sent, sender

  Session _sessionForSessionType(OptionalText type, bool allowCreation);
  Session _openSession(OptionalText type);
  void _reallyEndSession(const EndRequest& request);
  void _sessionBecameInactive(void* object);
  void _notePoorNetworkConditions();
  void _recordLine(const AgentLogRecord& record, std::string_view categorySuffix);

  void _noteActivity();
  void _setInactivityTimer();
  void _clearInactivityTimer();
  void _serverBecameInactive();

  [[nodiscard]] std::chrono::milliseconds _inactivityLimit() const {
    return _platform.configuration.inactivityLimit.value_or(kInactivityLimit);
  }

  Platform& _platform;
  AgentHooks _hooks;  ///< before the sessions: it may keep what their services are made of
  SessionServices& _sessionServices;
  LoggingSwitches _switches;
  MainThreadCheck _mainThread;
  std::string _line, _lineCategory;  ///< of the record being written; kept for their memory

  std::unique_ptr<IpcListener> _listener;
  Sessions _sessions;
  std::optional<SteadyTime> _lastActivity;
  bool _pendingInactivityTimer = false;
  bool _automationRunning = false;

  ScopedTimer _inactivityRequest;
  LocalNotifications::ObserverId _inactiveSessionObserver = 0;
  std::shared_ptr<void> _delayedEnds;  ///< last: when it goes, pending ends find nobody
};

}  // namespace zal
