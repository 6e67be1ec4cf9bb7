#include "platform/linux/loop/linux_clock.h"

#include <time.h>

#include <atomic>

#include "platform/linux/loop/steady_time.h"

namespace zal {

namespace {

// Counts the zones that were in force, so that no thread answers from one that is gone.
std::atomic<unsigned> zoneGeneration{0};

constexpr std::chrono::sys_seconds kEndOfCalendar =
    std::chrono::sys_days{std::chrono::year{10000} / std::chrono::January / 1};

struct LastSecond {
  std::chrono::sys_seconds second;
  unsigned generation = 0;
  LocalTime time;
};

LocalTime takeApart(std::chrono::sys_seconds second) {
  const time_t seconds = second.time_since_epoch().count();
  tm parts{};
  LocalTime result;
  if (::localtime_r(&seconds, &parts) == nullptr) return result;
  result.year = parts.tm_year + 1900;
  result.month = parts.tm_mon + 1;
  result.day = parts.tm_mday;
  result.hour = parts.tm_hour;
  result.minute = parts.tm_min;
  result.second = parts.tm_sec;
  return result;
}

std::chrono::seconds zoneOffsetAt(std::chrono::sys_seconds second) {
  const time_t seconds = second.time_since_epoch().count();
  tm parts{};
  if (::localtime_r(&seconds, &parts) == nullptr) return {};
  return std::chrono::seconds{parts.tm_gmtoff};
}

}  // namespace

LinuxClock::LinuxClock() {
  ::tzset();
  zoneGeneration.fetch_add(1);
}

SteadyTime LinuxClock::steadyNow() const { return steadyTime(); }

SteadyTime LinuxClock::steadyNowRoughly() const { return roughSteadyTime(); }

WallTime LinuxClock::wallNow() const {
  return std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
}

LocalTime LinuxClock::localTime(WallTime moment) const {
  // localtime_r takes a lock of the whole process and walks the zone's rules.
  thread_local LastSecond last;
  const auto second = std::chrono::floor<std::chrono::seconds>(moment);
  const unsigned generation = zoneGeneration.load(std::memory_order_relaxed);
  if (last.generation != generation || last.second != second) {
    last = {second, generation, takeApart(second)};
  }
  LocalTime result = last.time;
  result.millisecond =
      static_cast<int>(std::chrono::floor<std::chrono::milliseconds>(moment - second).count());
  return result;
}

std::optional<WallTime> LinuxClock::momentOf(const LocalTime& time) const {
  const std::chrono::year_month_day date{std::chrono::year{time.year},
                                         std::chrono::month{static_cast<unsigned>(time.month)},
                                         std::chrono::day{static_cast<unsigned>(time.day)}};
  if (!date.ok() || time.hour < 0 || time.hour > 23 || time.minute < 0 || time.minute > 59 ||
      time.second < 0 || time.second > 60) {
    return std::nullopt;
  }
  const auto shown = std::chrono::sys_days{date} + std::chrono::hours{time.hour} +
                     std::chrono::minutes{time.minute} + std::chrono::seconds{time.second};
  // A leap second may follow the last second of all, which no calendar of ours shows.
  if (shown >= kEndOfCalendar) return std::nullopt;
  // mktime would look for another zone, and from then on every thread would answer from that one.
  const auto nearby = shown - zoneOffsetAt(shown);
  return WallTime{shown - zoneOffsetAt(nearby)} + std::chrono::milliseconds{time.millisecond};
}

std::string LinuxClock::zoneAbbreviation() const {
  const time_t now = std::chrono::system_clock::to_time_t(std::chrono::system_clock::now());
  tm parts{};
  if (::localtime_r(&now, &parts) == nullptr || parts.tm_zone == nullptr) return {};
  return parts.tm_zone;
}

}  // namespace zal
