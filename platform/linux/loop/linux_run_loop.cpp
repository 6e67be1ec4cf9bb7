#include "platform/linux/loop/linux_run_loop.h"

#include <sys/timerfd.h>
#include <unistd.h>

#include <algorithm>
#include <cassert>
#include <cerrno>
#include <system_error>

#include <asio/post.hpp>

#include "platform/linux/loop/steady_time.h"
#include "platform/main_thread_watch.h"

namespace zal {

namespace {

// How many handlers run before due timers get their turn again, so that a flood delays none.
constexpr int kHandlersPerTurn = 64;
// Far beyond any use, and still addable to the present without overflow.
constexpr std::chrono::nanoseconds kLongestDelay = std::chrono::hours{24 * 365 * 100};

/// Counts the host's sleep: what fell due meanwhile wakes the loop when the host does.
int makeAlarm() {
  const int alarm = ::timerfd_create(CLOCK_BOOTTIME, TFD_NONBLOCK | TFD_CLOEXEC);
  if (alarm < 0) throw std::system_error(errno, std::generic_category(), "timerfd_create");
  return alarm;
}

/// Under the type of what runs, which says where it was written.
void runWatched(std::string_view kind, const RunLoop::Task& task) {
  const MainThreadWatch::Span span(kind, task.target_type().name());
  task();
}

}  // namespace

LinuxRunLoop::LinuxRunLoop() {
  _alarm.assign(makeAlarm());
  _awaitAlarm();
}

LinuxRunLoop::~LinuxRunLoop() = default;

void LinuxRunLoop::run() {
  _mainThread.check("LinuxRunLoop");
  while (!_context.stopped()) {
    const bool fired = _fireDueTimers();
    const bool ran = _runReadyHandlers();
    if (fired || ran || _context.stopped()) continue;
    _runSleepObservers();
    _setAlarm();
    _context.run_one();
  }
  _context.restart();
}

void LinuxRunLoop::stop() { _context.stop(); }

void LinuxRunLoop::post(Task task) {
  asio::post(_context, [task = std::move(task)] { runWatched("task", task); });
}

TimerId LinuxRunLoop::callAfter(std::chrono::nanoseconds delay, Task task) {
  return _addTimer(std::max(delay, std::chrono::nanoseconds{0}), {{}, std::move(task)});
}

TimerId LinuxRunLoop::callEvery(std::chrono::nanoseconds interval, Task task) {
  assert(interval.count() > 0);
  return _addTimer(interval, {interval, std::move(task)});
}

TimerId LinuxRunLoop::_addTimer(std::chrono::nanoseconds delay, Timer timer) {
  _mainThread.check("LinuxRunLoop");
  const SteadyTime deadline = steadyTime() + std::min(delay, kLongestDelay);
  _timers.emplace(TimerKey{deadline, ++_lastTimer}, std::move(timer));
  _deadlines.emplace(_lastTimer, deadline);
  return TimerId{_lastTimer};
}

void LinuxRunLoop::cancel(TimerId timer) {
  _mainThread.check("LinuxRunLoop");
  const auto found = _deadlines.find(static_cast<std::uint64_t>(timer));
  if (found == _deadlines.end()) return;
  _timers.erase({found->second, found->first});
  _deadlines.erase(found);
}

void LinuxRunLoop::addSleepObserver(Task task) {
  _mainThread.check("LinuxRunLoop");
  _sleepObservers.push_back(std::move(task));
}

bool LinuxRunLoop::_fireDueTimers() {
  if (_timers.empty()) return false;
  const SteadyTime now = steadyTime();
  bool fired = false;
  while (!_timers.empty() && _timers.begin()->first.first <= now && !_context.stopped()) {
    fired = true;
    auto due = _timers.extract(_timers.begin());
    if (due.mapped().interval.count() == 0) {
      _deadlines.erase(due.key().second);
      runWatched("timer", due.mapped().task);
      continue;
    }
    try {
      runWatched("timer", due.mapped().task);
    } catch (...) {
      _armNextBeat(std::move(due));
      throw;
    }
    _armNextBeat(std::move(due));
  }
  return fired;
}

void LinuxRunLoop::_armNextBeat(Timers::node_type&& timer) {
  const auto deadline = _deadlines.find(timer.key().second);
  if (deadline == _deadlines.end()) return;  // its own task cancelled it
  // The next instant of the grid that still lies ahead: no drift, and missed beats are not made up.
  const auto late = steadyTime() - timer.key().first;
  timer.key().first += timer.mapped().interval * (late / timer.mapped().interval + 1);
  deadline->second = timer.key().first;
  _timers.insert(std::move(timer));
}

bool LinuxRunLoop::_runReadyHandlers() {
  int count = 0;
  for (; count < kHandlersPerTurn; ++count) {
    const MainThreadWatch::Span span("handler");
    if (_context.poll_one() == 0) break;
  }
  return count > 0;
}

void LinuxRunLoop::_runSleepObservers() {
  for (std::size_t i = 0; i < _sleepObservers.size(); ++i) {
    runWatched("before sleep", _sleepObservers[i]);
  }
}

void LinuxRunLoop::_setAlarm() {
  const SteadyTime next = _timers.empty() ? SteadyTime::max() : _timers.begin()->first.first;
  if (next == _alarmSetFor) return;
  itimerspec setting{};  // all zero: off
  if (next != SteadyTime::max()) {
    const auto sinceBoot = next.time_since_epoch();
    const auto seconds = std::chrono::floor<std::chrono::seconds>(sinceBoot);
    setting.it_value = {static_cast<time_t>(seconds.count()),
                        static_cast<long>((sinceBoot - seconds).count())};
  }
  if (::timerfd_settime(_alarm.native_handle(), TFD_TIMER_ABSTIME, &setting, nullptr) != 0) {
    throw std::system_error(errno, std::generic_category(), "timerfd_settime");
  }
  _alarmSetFor = next;
}

void LinuxRunLoop::_awaitAlarm() {
  _alarm.async_wait(asio::posix::descriptor_base::wait_read, [this](const std::error_code& error) {
    if (error) return;
    std::uint64_t expirations = 0;
    // Takes the readiness back; what is due the next turn finds out by itself. Nothing to read means
    // that the alarm was set anew meanwhile.
    const auto got = ::read(_alarm.native_handle(), &expirations, sizeof expirations);
    if (got == sizeof expirations) _alarmSetFor = SteadyTime::max();
    _awaitAlarm();
  });
}

void LinuxRunLoop::onSignal(int signal, Task task) {
  _mainThread.check("LinuxRunLoop");
  _signalWatches.emplace_back(_context, signal, std::move(task));
  _awaitSignal(_signalWatches.back());
}

void LinuxRunLoop::_awaitSignal(SignalWatch& watch) {
  watch.signals.async_wait([this, &watch](const std::error_code& error, int /*signal*/) {
    if (error) return;
    _awaitSignal(watch);
    runWatched("signal", watch.task);
  });
}

}  // namespace zal
