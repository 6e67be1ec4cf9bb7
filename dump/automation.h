#pragma once

#include <string>

#include "platform/value.h"
#include "session/optional_text.h"

namespace zal {

class ActionServer;
class AgentLog;
class SystemShell;
class UserAlerts;
struct Configuration;

/// Starts and stops test automation: one command line each, one alert each. Stops are
/// unconditional; a start while one runs starts a second. Main thread only.
class Automation {
 public:
  Automation(const Configuration& configuration, AgentLog& log, SystemShell& shell, UserAlerts& alerts)
      : _configuration(configuration), _log(log), _shell(shell), _alerts(alerts) {}

  void startVideoCalls(OptionalText sender, ActionServer& server);
  void stopVideoCalls(OptionalText sender, ActionServer& server);
  /// Only on an internal install. Reads "target", "interval" and "repetitions".
  void startMessaging(OptionalText sender, const ValueMap* userInfo, ActionServer& server);
  void stopMessaging(OptionalText sender, ActionServer& server);

 private:
  void _alert(const std::string& title, const std::string& message);

  const Configuration& _configuration;
  AgentLog& _log;
  SystemShell& _shell;
  UserAlerts& _alerts;
};

}  // namespace zal
