#pragma once

#include "session/optional_text.h"

namespace zal {

/// What actions need of the server they are carried out for. Main thread only.
class ActionServer {
 public:
  virtual ~ActionServer() = default;
  /// Tells every open session.
  virtual void notePoorNetworkConditions() = 0;
  /// Starts the pings of that type's open session; does nothing without one.
  virtual void startPing(OptionalText sessionType, bool useWifi) = 0;
  /// A running automation keeps an idle process alive.
  virtual void setAutomationRunning(bool running) = 0;
  /// Called for the completion alert of a dump when the person has dealt with it.
  virtual void userNotificationDidFinish() = 0;
};

}  // namespace zal
