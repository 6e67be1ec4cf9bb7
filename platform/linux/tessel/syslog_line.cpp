#include "platform/linux/tessel/syslog_line.h"

#include <array>
#include <charconv>
#include <cstddef>
#include <cstdint>

#include "platform/linux/log/record_text.h"
#include "platform/linux/tessel/record_line.h"

namespace zal::tessel {
namespace {

using std::chrono::hours;
using std::chrono::microseconds;
using std::chrono::minutes;
using std::chrono::seconds;

/// Takes a line apart from the left; once something did not fit, nothing does any more.
class Cursor {
 public:
  explicit Cursor(std::string_view text) : _rest(text) {}
  [[nodiscard]] bool fits() const { return _fits; }
  [[nodiscard]] std::string_view rest() const { return _rest; }
  [[nodiscard]] bool next(char c) const { return _fits && _rest.starts_with(c); }
  void skip(char c) {
    _fits = next(c);
    if (_fits) _rest.remove_prefix(1);
  }
  /// Exactly so many digits.
  int digits(std::size_t count) {
    int value = 0;
    for (std::size_t i = 0; i < count; ++i) {
      _fits = _fits && !_rest.empty() && _rest.front() >= '0' && _rest.front() <= '9';
      if (!_fits) return 0;
      value = value * 10 + (_rest.front() - '0');
      _rest.remove_prefix(1);
    }
    return value;
  }
  std::string_view take(std::size_t count) {
    _fits = _fits && _rest.size() >= count;
    const std::string_view taken = _fits ? _rest.substr(0, count) : std::string_view();
    if (_fits) _rest.remove_prefix(count);
    return taken;
  }

 private:
  std::string_view _rest;
  bool _fits = true;
};

microseconds takeFraction(Cursor& cursor) {
  std::int64_t value = 0;
  std::int64_t unit = 1'000'000;
  do {
    value += (unit /= 10) * cursor.digits(1);
  } while (cursor.fits() && !cursor.rest().empty() && cursor.rest().front() >= '0' &&
           cursor.rest().front() <= '9');
  return microseconds(value);
}

struct Stamp {
  WallTime time;
  std::string_view rest;  ///< behind the time's blank
};

/// "2024-11-21T17:34:18.123456+01:00 "
std::optional<Stamp> exactStamp(std::string_view line) {
  Cursor cursor(line);
  const int year = cursor.digits(4);
  cursor.skip('-');
  const int month = cursor.digits(2);
  cursor.skip('-');
  const int day = cursor.digits(2);
  cursor.skip('T');
  const int hour = cursor.digits(2);
  cursor.skip(':');
  const int minute = cursor.digits(2);
  cursor.skip(':');
  const int second = cursor.digits(2);
  microseconds fraction{};
  if (cursor.next('.')) {
    cursor.skip('.');
    fraction = takeFraction(cursor);
  }
  minutes offset{};
  if (cursor.next('Z')) {
    cursor.skip('Z');
  } else {
    const int sign = cursor.next('-') ? -1 : 1;
    cursor.skip(sign < 0 ? '-' : '+');
    offset += sign * hours(cursor.digits(2));
    cursor.skip(':');
    offset += sign * minutes(cursor.digits(2));
  }
  cursor.skip(' ');
  const std::chrono::year_month_day date{std::chrono::year(year),
                                         std::chrono::month(static_cast<unsigned>(month)),
                                         std::chrono::day(static_cast<unsigned>(day))};
  if (!cursor.fits() || !date.ok() || hour > 23 || minute > 59 || second > 60) return std::nullopt;
  const WallTime time =
      std::chrono::sys_days(date) + hours(hour) + minutes(minute) + seconds(second) + fraction - offset;
  return Stamp{time, cursor.rest()};
}

int monthNumber(std::string_view name) {
  constexpr std::string_view kNames = "JanFebMarAprMayJunJulAugSepOctNovDec";
  for (std::size_t month = 0; month < 12; ++month) {
    if (kNames.substr(month * 3, 3) == name) return static_cast<int>(month) + 1;
  }
  return 0;
}

/// "Nov 21 17:34:18 ": the local time of some year.
std::optional<Stamp> yearlessStamp(std::string_view line, WallTime now, const Clock& clock) {
  Cursor cursor(line);
  LocalTime local;
  local.month = monthNumber(cursor.take(3));
  cursor.skip(' ');
  if (cursor.next(' ')) {
    cursor.skip(' ');
    local.day = cursor.digits(1);
  } else {
    local.day = cursor.digits(2);
  }
  cursor.skip(' ');
  local.hour = cursor.digits(2);
  cursor.skip(':');
  local.minute = cursor.digits(2);
  cursor.skip(':');
  local.second = cursor.digits(2);
  cursor.skip(' ');
  if (!cursor.fits() || local.month == 0) return std::nullopt;
  // Eight years back there was a 29th of February for certain.
  const int latest = clock.localTime(now + hours(24)).year;
  for (local.year = latest; local.year > latest - 9; --local.year) {
    const auto moment = clock.momentOf(local);
    if (moment && *moment <= now + hours(24)) return Stamp{*moment, cursor.rest()};
  }
  return std::nullopt;
}

}  // namespace

std::optional<WallTime> syslogLineTime(std::string_view line, WallTime now, const Clock& clock) {
  auto stamp = exactStamp(line);
  if (!stamp) stamp = yearlessStamp(line, now, clock);
  return stamp ? std::optional(stamp->time) : std::nullopt;
}

std::string printedSyslogLine(std::string_view line, WallTime now, const Clock& clock) {
  std::string printed;
  if (const auto stamp = exactStamp(line)) {
    printed = timeText(stamp->time, clock) + ' ';
    line = stamp->rest;
  } else if (!yearlessStamp(line, now, clock)) {
    printed = kContinuationMark;
  }
  appendOneLine(printed, line);
  return printed + '\n';
}

}  // namespace zal::tessel
