#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <system_error>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/linux/alerts/alert_record.h"
#include "platform/linux/alerts/alert_screen.h"
#include "platform/linux/notifications/directory_watch.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"
#include "platform/user_alerts.h"

namespace zal {

/// Alerts as record files in the runtime directory, for whoever answers them there: see answerAlert
/// and docs/runtime-directory.md. Each one is announced on the agent's log. Nothing is made, read or
/// watched before the first alert, and one that nobody answers costs no time at all.
///
/// Records stay after their alerts: those that are over, and notices, until there are 50 newer ones.
/// Where the directory cannot be used, one warning is logged and the alert is never answered.
class RuntimeAlertStore : public UserAlerts {
 public:
  /// The io_context is the main run loop's; everything outlives this. Made on the main thread.
  RuntimeAlertStore(asio::io_context& context, RunLoop& loop, const Clock& clock, AgentLog& log,
                    std::string directory);
  ~RuntimeAlertStore() override;
  RuntimeAlertStore(const RuntimeAlertStore&) = delete;
  RuntimeAlertStore& operator=(const RuntimeAlertStore&) = delete;

  /// From now on each alert is on that screen too; answered in one place, it disappears from the other.
  /// The screen outlives this. Main thread.
  void showOn(AlertScreen& screen) { _screen = &screen; }

  /// Texts of more than 4 KiB are cut. While 1000 questions wait, further ones are dropped with a
  /// warning: somebody asks in a circle.
  void post(UserAlert alert, Listener listener) override;

  /// The process is about to end: the records of all that wait say so, the screen hears of it, and no
  /// listener runs any more.
  /// Main thread.
  void cutOffWaiting();

 private:
  struct Waiting {
    AlertRecord record;
    Listener listener;
    ScopedTimer timeout;
  };
  void _accept(UserAlert alert, Listener listener);
  bool _isReady();
  void _lookAtOldRecords();
  void _lookAtOldRecord(unsigned number);
  std::optional<unsigned> _place(AlertRecord& record);
  void _announce(const AlertRecord& record);
  void _show(const AlertRecord& record, unsigned number);
  void _takeScreenAnswer(unsigned number, AlertAnswer answer);
  void _armTimeout(unsigned number, Waiting& waiting);
  void _takeArrival(std::string_view name);
  void _takeAllAnswers();
  void _takeAnswer(unsigned number, const std::string& path);
  void _refuseAnswer(std::string_view id, const std::string& path, std::string_view reason);
  void _finish(unsigned number, AlertState state, const std::optional<AlertAnswer>& answer);
  void _prune();
  void _forget(unsigned number);
  void _rewrite(const AlertRecord& record);
  void _complain(const std::string& problem);
  [[nodiscard]] std::string _recordPath(unsigned number) const;
  [[nodiscard]] std::string _answerPath(unsigned number) const;

  asio::io_context& _context;
  RunLoop& _loop;
  const Clock& _clock;
  AgentLog& _log;
  const std::string _directory;
  AlertScreen* _screen = nullptr;
  ProcessIdentity _agent;
  std::map<unsigned, Waiting> _waiting;
  std::set<unsigned> _disposable;  // over, or notices
  std::size_t _questions = 0;      // among those that wait
  unsigned _lastNumber = 0;
  bool _complained = false;  // of the outage that lasts
  MainThreadCheck _mainThread;
  std::unique_ptr<DirectoryWatch> _watch;                       // with the first alert
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
