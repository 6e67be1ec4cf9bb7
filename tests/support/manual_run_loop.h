#pragma once

#include <chrono>
#include <deque>
#include <map>
#include <mutex>
#include <optional>
#include <utility>
#include <vector>

#include "platform/clock.h"
#include "platform/run_loop.h"

namespace zal::testing {

/// The test's run loop and clock in one: time passes only in advance(). The local zone is two hours
/// ahead of UTC and called CEST unless a test sets another.
class ManualRunLoop : public RunLoop, public Clock {
 public:
  // RunLoop. run() runs what is posted until nothing is left or stop() was called; a stop()
  // that came before makes it return at once.
  void run() override;
  void stop() override { _stopped = true; }
  void post(Task task) override;
  TimerId callAfter(std::chrono::nanoseconds delay, Task task) override;
  TimerId callEvery(std::chrono::nanoseconds interval, Task task) override;
  void cancel(TimerId timer) override;
  void addSleepObserver(Task task) override;

  // Clock
  [[nodiscard]] SteadyTime steadyNow() const override { return _now; }
  [[nodiscard]] WallTime wallNow() const override;
  [[nodiscard]] LocalTime localTime(WallTime moment) const override;
  [[nodiscard]] std::optional<WallTime> momentOf(const LocalTime& time) const override;
  [[nodiscard]] std::string zoneAbbreviation() const override { return zone; }

  /// Runs every posted task, and what those post, then the sleep observers.
  void drain();
  /// Lets time pass: each due timer fires at its own instant, in deadline order, ties in the order
  /// of creation, newly armed ones included; posted tasks run before the next timer.
  void advance(std::chrono::nanoseconds duration);
  /// The host sleeps: both clocks move on, and what fell due meanwhile fires when it wakes, a repeating
  /// timer once.
  void sleep(std::chrono::nanoseconds duration);
  /// The wall clock jumps; steady time does not move.
  void setWall(WallTime moment);
  [[nodiscard]] std::size_t pendingTimers() const { return _timers.size(); }

  std::string zone = "CEST";
  std::chrono::seconds zoneOffset = std::chrono::hours{2};

 private:
  struct Timer {
    SteadyTime deadline;
    std::chrono::nanoseconds interval{0};
    Task task;
  };
  void _fire(std::uint64_t id);

  SteadyTime _now{std::chrono::hours{1}};
  // 2024-05-02T12:03:07.251Z
  WallTime _wallBase{std::chrono::milliseconds{1714651387251}};
  SteadyTime _steadyBase{_now};
  std::map<std::uint64_t, Timer> _timers;
  std::uint64_t _lastTimer = 0;
  std::mutex _postMutex;  // post() may come from a real thread
  std::deque<Task> _posted;
  std::vector<Task> _sleepObservers;
  bool _stopped = false;
};

}  // namespace zal::testing
