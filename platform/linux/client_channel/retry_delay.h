#pragma once

#include <algorithm>
#include <chrono>

namespace zal {

/// When a client may try to connect again: after each failure in a row it waits twice as long. A
/// connection that never got to an answer and broke soon counts as a failure too, so that an agent
/// that turns this client away is not besieged.
class RetryDelay {
 public:
  using Moment = std::chrono::steady_clock::time_point;
  RetryDelay(std::chrono::milliseconds first, std::chrono::milliseconds longest)
      : _first(first), _longest(longest), _next(first) {}

  void failed(Moment now) {
    _due = now + _next;
    _next = std::min(_next * 2, _longest);
  }
  void postpone(Moment due) { _due = due; }
  void worked() { _next = _first; }
  [[nodiscard]] bool isDue(Moment now) const { return now >= _due; }
  [[nodiscard]] Moment due() const { return _due; }

 private:
  std::chrono::milliseconds _first;
  std::chrono::milliseconds _longest;
  std::chrono::milliseconds _next;
  Moment _due;
};

}  // namespace zal
