#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <utility>

namespace zal {

/// Names one pending timer of one run loop.
enum class TimerId : std::uint64_t { none = 0 };

/// The main thread's loop: tasks, timers, and what must happen before it sleeps.
///
///     loop.post([&] { server.start(); });
///     auto id = loop.callAfter(3s, [&] { endSession(); });
///     loop.run();   // until stop()
class RunLoop {
 public:
  using Task = std::function<void()>;
  virtual ~RunLoop() = default;

  /// Runs tasks and timers on the calling thread until stop(). What a task throws passes through.
  virtual void run() = 0;
  /// Any thread. run() returns after the task that is running now.
  virtual void stop() = 0;
  /// Any thread. Tasks run in the order posted, never inside post().
  virtual void post(Task task) = 0;

  // Main thread only from here on.

  /// Runs the task once, no earlier than `delay` of steady time from now; when the host slept over that
  /// moment, as soon as it is awake.
  virtual TimerId callAfter(std::chrono::nanoseconds delay, Task task) = 0;
  /// Runs the task every `interval`, first after one interval; missed beats are not made up.
  virtual TimerId callEvery(std::chrono::nanoseconds interval, Task task) = 0;
  /// Ids that are unknown, past or `none` are ignored. A timer may cancel itself while it runs.
  virtual void cancel(TimerId timer) = 0;
  /// Runs the task each time before the loop waits with nothing left to do, for as long as the loop
  /// lives. For writing out what was buffered; the task must not post to the loop.
  virtual void addSleepObserver(Task task) = 0;
};

/// A timer that is cancelled with its owner. Main thread only; the loop outlives it.
class ScopedTimer {
 public:
  ScopedTimer() = default;
  ScopedTimer(RunLoop& loop, TimerId timer) : _loop(&loop), _timer(timer) {}
  ScopedTimer(ScopedTimer&& other) noexcept
      : _loop(std::exchange(other._loop, nullptr)), _timer(std::exchange(other._timer, TimerId::none)) {}
  ScopedTimer& operator=(ScopedTimer&& other) noexcept {
    if (this != &other) {
      cancel();
      _loop = std::exchange(other._loop, nullptr);
      _timer = std::exchange(other._timer, TimerId::none);
    }
    return *this;
  }
  ScopedTimer(const ScopedTimer&) = delete;
  ScopedTimer& operator=(const ScopedTimer&) = delete;
  ~ScopedTimer() { cancel(); }

  void cancel() {
    if (_loop != nullptr && _timer != TimerId::none) _loop->cancel(_timer);
    _timer = TimerId::none;
  }
  [[nodiscard]] bool isSet() const { return _timer != TimerId::none; }

 private:
  RunLoop* _loop = nullptr;
  TimerId _timer = TimerId::none;
};

}  // namespace zal
