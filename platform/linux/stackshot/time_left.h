#pragma once

#include <chrono>

namespace zal::stackshot {

/// How long the program may go on: until its limit, or until somebody tells it to end. One a process.
class TimeLeft {
 public:
  using Clock = std::chrono::steady_clock;

  /// From now on SIGTERM, SIGINT and SIGHUP ask for an early end. Should even that take longer than a
  /// second, or the limit be passed by two, because the program hangs in the kernel or a library, the
  /// process ends at once: the kernel then lets go whatever it still holds.
  explicit TimeLeft(std::chrono::milliseconds limit);
  TimeLeft(const TimeLeft&) = delete;
  TimeLeft& operator=(const TimeLeft&) = delete;

  [[nodiscard]] bool isOver() const;
  /// Why it is over, for people; empty while it is not.
  [[nodiscard]] const char* whyOver() const;
  /// The end, or so much from now when that is earlier.
  [[nodiscard]] Clock::time_point atMost(std::chrono::milliseconds time) const;

 private:
  Clock::time_point _end;
};

}  // namespace zal::stackshot
