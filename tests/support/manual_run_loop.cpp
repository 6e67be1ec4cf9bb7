#include "tests/support/manual_run_loop.h"

namespace zal::testing {

void ManualRunLoop::run() {
  drain();
  _stopped = false;
}

void ManualRunLoop::post(Task task) {
  const std::scoped_lock lock(_postMutex);
  _posted.push_back(std::move(task));
}

TimerId ManualRunLoop::callAfter(std::chrono::nanoseconds delay, Task task) {
  _timers.emplace(++_lastTimer,
                  Timer{_now + std::max(delay, std::chrono::nanoseconds{0}), {}, std::move(task)});
  return TimerId{_lastTimer};
}

TimerId ManualRunLoop::callEvery(std::chrono::nanoseconds interval, Task task) {
  _timers.emplace(++_lastTimer, Timer{_now + interval, interval, std::move(task)});
  return TimerId{_lastTimer};
}

void ManualRunLoop::cancel(TimerId timer) { _timers.erase(static_cast<std::uint64_t>(timer)); }

void ManualRunLoop::addSleepObserver(Task task) { _sleepObservers.push_back(std::move(task)); }

WallTime ManualRunLoop::wallNow() const {
  return _wallBase + std::chrono::duration_cast<std::chrono::microseconds>(_now - _steadyBase);
}

void ManualRunLoop::setWall(WallTime moment) {
  _wallBase = moment;
  _steadyBase = _now;
}

std::optional<WallTime> ManualRunLoop::momentOf(const LocalTime& time) const {
  const std::chrono::year_month_day date{std::chrono::year{time.year},
                                         std::chrono::month{static_cast<unsigned>(time.month)},
                                         std::chrono::day{static_cast<unsigned>(time.day)}};
  if (!date.ok() || time.hour < 0 || time.hour > 23 || time.minute < 0 || time.minute > 59 ||
      time.second < 0 || time.second > 60) {
    return std::nullopt;
  }
  return WallTime{std::chrono::sys_days{date}} + std::chrono::hours{time.hour} +
         std::chrono::minutes{time.minute} + std::chrono::seconds{time.second} +
         std::chrono::milliseconds{time.millisecond} - zoneOffset;
}

LocalTime ManualRunLoop::localTime(WallTime moment) const {
  const auto local = moment + zoneOffset;
  const auto days = std::chrono::floor<std::chrono::days>(local);
  const std::chrono::year_month_day date{days};
  const std::chrono::hh_mm_ss time{std::chrono::floor<std::chrono::milliseconds>(local - days)};
  LocalTime result;
  result.year = static_cast<int>(date.year());
  result.month = static_cast<int>(static_cast<unsigned>(date.month()));
  result.day = static_cast<int>(static_cast<unsigned>(date.day()));
  result.hour = static_cast<int>(time.hours().count());
  result.minute = static_cast<int>(time.minutes().count());
  result.second = static_cast<int>(time.seconds().count());
  result.millisecond = static_cast<int>(time.subseconds().count());
  return result;
}

void ManualRunLoop::drain() {
  for (;;) {
    Task task;
    {
      const std::scoped_lock lock(_postMutex);
      if (_stopped || _posted.empty()) break;
      task = std::move(_posted.front());
      _posted.pop_front();
    }
    task();
  }
  for (std::size_t i = 0; i < _sleepObservers.size(); ++i) _sleepObservers[i]();
}

void ManualRunLoop::advance(std::chrono::nanoseconds duration) {
  const SteadyTime end = _now + duration;
  drain();
  for (;;) {
    auto next = _timers.end();
    for (auto it = _timers.begin(); it != _timers.end(); ++it) {
      if (it->second.deadline > end) continue;
      if (next == _timers.end() || it->second.deadline < next->second.deadline) next = it;
    }
    if (next == _timers.end()) break;
    _now = std::max(_now, next->second.deadline);
    _fire(next->first);
    drain();
  }
  _now = end;
}

void ManualRunLoop::sleep(std::chrono::nanoseconds duration) {
  drain();
  _now += duration;
  advance({});
}

void ManualRunLoop::_fire(std::uint64_t id) {
  Timer& timer = _timers.at(id);
  if (timer.interval.count() > 0) {
    timer.deadline += timer.interval * ((_now - timer.deadline) / timer.interval + 1);
    const Task task = timer.task;  // the task may cancel its own timer
    task();
    return;
  }
  const Task task = std::move(timer.task);
  _timers.erase(id);
  task();
}

}  // namespace zal::testing
