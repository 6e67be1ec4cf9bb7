#pragma once

#include <optional>
#include <string>

#include "platform/agent_log.h"
#include "platform/linux/bus/bus_conversation.h"

namespace zal {

/// Says in the log how a daemon fares: one line when that changes, however often it is asked. That it
/// refused a question is no news: it is well. Main thread only.
class DaemonNote {
 public:
  /// `name` is how the log calls it: "NetworkManager".
  DaemonNote(AgentLog& log, std::string name) : _log(log), _name(std::move(name)) {}
  void note(BusTrouble trouble);

 private:
  AgentLog& _log;
  const std::string _name;
  BusTrouble _last = BusTrouble::none;
};

}  // namespace zal
