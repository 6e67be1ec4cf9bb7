#pragma once

#include <chrono>
#include <optional>
#include <string>

namespace zal {

/// Wall-clock moment, microseconds since 1970 UTC. What people read.
using WallTime = std::chrono::sys_time<std::chrono::microseconds>;
/// Steady moment. What intervals are measured in: only moves forward, whatever the wall clock does, and
/// counts the time that the host sleeps. Never mixed with steady_clock::now(), which may not.
using SteadyTime = std::chrono::steady_clock::time_point;

/// A wall-clock moment taken apart in the local zone, proleptic Gregorian calendar.
struct LocalTime {
  int year = 1970;
  int month = 1;   ///< 1 to 12
  int day = 1;     ///< 1 to 31
  int hour = 0;    ///< 0 to 23
  int minute = 0;  ///< 0 to 59
  int second = 0;  ///< 0 to 60
  int millisecond = 0;
};

/// The host's two clocks and its local calendar. Any thread; never blocks.
class Clock {
 public:
  virtual ~Clock() = default;
  [[nodiscard]] virtual SteadyTime steadyNow() const = 0;
  /// Late by some milliseconds at most, for a fraction of the cost: for what is noted at every record.
  [[nodiscard]] virtual SteadyTime steadyNowRoughly() const { return steadyNow(); }
  [[nodiscard]] virtual WallTime wallNow() const = 0;
  /// Any moment of the years 1 to 9999 works; the process locale plays no part.
  [[nodiscard]] virtual LocalTime localTime(WallTime moment) const = 0;
  /// The moment at which the local calendar shows this; nothing when there is no such date. A time
  /// that a change of the clocks skips or repeats is one of the moments around it.
  [[nodiscard]] virtual std::optional<WallTime> momentOf(const LocalTime& time) const = 0;
  /// The local zone's abbreviation as it is now ("CET"); empty when the zone has none.
  [[nodiscard]] virtual std::string zoneAbbreviation() const = 0;
};

/// Seconds since 1970 as clients send them. Sub-microsecond parts are dropped.
[[nodiscard]] double secondsSinceEpoch(WallTime moment);
/// The reverse, for any double a client can send: what lies outside the years 1 to 9999 is clamped
/// to them, and a value that is no number becomes 1970.
[[nodiscard]] WallTime wallTimeFromSeconds(double seconds);

}  // namespace zal
