#pragma once

#include <array>
#include <chrono>
#include <string_view>

#include "platform/clock.h"

namespace zal {

/// The local time as "yyyy-MM-dd HH:mm:ss.SSS". Takes the calendar apart once a second only. Not for
/// several threads.
class RecordTime {
 public:
  explicit RecordTime(const Clock& clock) : _clock(clock) {}
  /// Of this moment, or of one of the last few calls when hardly any time has passed since: of a flood
  /// not every record asks the clock. Valid until the next call.
  [[nodiscard]] std::string_view nowText();
  /// Time passes here: the next call asks the clock.
  void forget() { _calls = 0; }

 private:
  /// A flood's records come a microsecond apart, so that they are never late by what the text shows.
  static constexpr unsigned kCallsBetweenLooks = 16;
  void _setSecond(WallTime moment);

  const Clock& _clock;
  unsigned _calls = 0;  // that the last look may still serve
  SteadyTime _lookedAt{};
  std::chrono::sys_seconds _second{std::chrono::seconds::min()};
  std::array<char, 23> _text{};
};

}  // namespace zal
