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
  /// Valid until the next call.
  [[nodiscard]] std::string_view nowText();

 private:
  void _setSecond(WallTime moment);

  const Clock& _clock;
  std::chrono::sys_seconds _second{std::chrono::seconds::min()};
  std::array<char, 23> _text{};
};

}  // namespace zal
