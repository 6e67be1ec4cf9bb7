#pragma once

#include <functional>
#include <string>

#include "platform/linux/alerts/alert_answer.h"
#include "platform/user_alerts.h"

namespace zal {

/// What becomes of one alert that a screen was given. At most one of them runs, once.
struct AlertHandlers {
  /// The person decided. Never within present().
  std::function<void(const AlertAnswer&)> onAnswer;
  /// It is not on this screen, now or any more. Possibly within present().
  std::function<void()> onDeclined;
};

/// A place where a person sees alerts and answers them by hand. Main thread only; nothing here waits
/// for a person, a server or a display.
///
///     screen.present("7", alert, {.onAnswer = ..., .onDeclined = ...});
///     screen.withdraw("7");   // answered elsewhere: it disappears, and no handler runs
class AlertScreen {
 public:
  virtual ~AlertScreen() = default;
  /// The id names the alert until a handler has run or it is withdrawn; it is in use once at a time.
  virtual void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) = 0;
  /// Ids that are unknown or past are ignored.
  virtual void withdraw(const std::string& id) = 0;
  /// The process is about to end, at once: what asks something disappears. What only tells something
  /// may stay where it does so without the agent. No handler runs any more.
  virtual void agentEnds() = 0;
};

}  // namespace zal
