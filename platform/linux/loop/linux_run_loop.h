#pragma once

#include <cstddef>
#include <deque>
#include <map>
#include <unordered_map>
#include <utility>

#include <asio/executor_work_guard.hpp>
#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>
#include <asio/signal_set.hpp>

#include "platform/clock.h"
#include "platform/main_thread_check.h"
#include "platform/run_loop.h"

namespace zal {

/// The main thread's loop on epoll. Made on the thread that runs it. While nothing is due it does
/// not wake up at all. Timers due at the same instant fire in the order they were made.
///
/// One turn: due timers; then up to a batch of ready handlers; when neither gave anything, the sleep
/// observers; then the wait.
class LinuxRunLoop : public RunLoop {
 public:
  LinuxRunLoop();
  ~LinuxRunLoop() override;
  LinuxRunLoop(const LinuxRunLoop&) = delete;
  LinuxRunLoop& operator=(const LinuxRunLoop&) = delete;

  /// After an exception passed through it may be called again. A stop() that came before makes it
  /// return at once; each return uses up the stop.
  void run() override;
  void stop() override;
  void post(Task task) override;
  TimerId callAfter(std::chrono::nanoseconds delay, Task task) override;
  TimerId callEvery(std::chrono::nanoseconds interval, Task task) override;
  void cancel(TimerId timer) override;
  void addSleepObserver(Task task) override;

  /// Runs the task on the loop each time the process gets the signal (SIGTERM, SIGHUP), which then
  /// no longer has its default effect, for as long as the loop lives. Several signals that arrive
  /// together may be delivered as one. Main thread only. Throws std::system_error for a signal that
  /// cannot be caught.
  void onSignal(int signal, Task task);

  /// For the other host services on this loop: their handlers run here, one at a time.
  [[nodiscard]] asio::io_context& context() { return _context; }

 private:
  // Deadline first, so that the first entry is the next one due; the number keeps ties in order.
  using TimerKey = std::pair<SteadyTime, std::uint64_t>;
  struct Timer {
    std::chrono::nanoseconds interval{0};  // 0: fires once
    Task task;
  };
  struct SignalWatch {
    SignalWatch(asio::io_context& context, int signal, Task what)
        : signals(context, signal), task(std::move(what)) {}
    asio::signal_set signals;
    Task task;
  };

  using Timers = std::map<TimerKey, Timer>;

  TimerId _addTimer(std::chrono::nanoseconds delay, Timer timer);
  bool _fireDueTimers();
  void _armNextBeat(Timers::node_type&& timer);
  bool _runReadyHandlers();
  void _runSleepObservers();
  void _setAlarm();
  void _awaitAlarm();
  void _awaitSignal(SignalWatch& watch);

  MainThreadCheck _mainThread;
  asio::io_context _context{1};
  asio::executor_work_guard<asio::io_context::executor_type> _keepRunning{_context.get_executor()};
  asio::posix::stream_descriptor _alarm{_context};
  SteadyTime _alarmSetFor = SteadyTime::max();  // max: not set
  Timers _timers;
  std::unordered_map<std::uint64_t, SteadyTime> _deadlines;
  std::uint64_t _lastTimer = 0;
  std::deque<Task> _sleepObservers;        // a deque: an observer may add another while it runs
  std::deque<SignalWatch> _signalWatches;  // a deque: handlers refer to its elements
};

}  // namespace zal
