#pragma once

#include <cstddef>
#include <functional>
#include <utility>

namespace zal {

/// Calls that are under way side by side, and what comes when all of them are answered. Main thread
/// only; not to be ended inside `next`.
///
///     calls.expect(2, [this] { compare(); });
///     bus.ask<bool>(first, [this](const auto&) { ...; calls.arrive(); });
///     bus.ask<bool>(second, [this](const auto&) { ...; calls.arrive(); });
class CallGroup {
 public:
  /// With none to expect, `next` comes at once.
  void expect(std::size_t answers, std::function<void()> next) {
    _missing = answers;
    _next = std::move(next);
    if (_missing == 0) _goOn();
  }
  void arrive() {
    if (--_missing == 0) _goOn();
  }

 private:
  void _goOn() { std::exchange(_next, nullptr)(); }

  std::size_t _missing = 0;
  std::function<void()> _next;
};

}  // namespace zal
