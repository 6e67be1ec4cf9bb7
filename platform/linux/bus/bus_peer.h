#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/linux/bus/private_bus.h"
#include "platform/value.h"

namespace zal {

struct PeerMethod {
  std::string path;
  std::string interface;
  std::string name;
};

/// One daemon's process as a thread that may wait asks it, over that thread's own connection. It is
/// spoken to under its unique name: a call to a process that ended starts no other. Once it has left a
/// question unanswered, which is logged, or all questions together took too long, every further one
/// fails at once: what is asked of a daemon that hangs does not add up. On the connection's thread.
class BusPeer {
 public:
  /// Of all questions together.
  static constexpr std::chrono::milliseconds kTotalLimit{4000};

  /// `title` is how the log calls the daemon.
  BusPeer(sdbus::IConnection& bus, std::string owner, std::string title, Clock& clock, AgentLog& log);

  /// The answer's values; nothing when the daemon refused or did not answer.
  template <class... Arguments>
  std::optional<ValueList> call(const PeerMethod& method, std::chrono::milliseconds limit,
                                const Arguments&... arguments);
  /// All properties of an interface; nothing when it is not there.
  std::optional<ValueMap> properties(const std::string& path, const std::string& interface);

 private:
  /// What the call may take; nothing when it must not be made.
  [[nodiscard]] std::optional<std::chrono::milliseconds> _limitOf(std::chrono::milliseconds wanted) const;
  [[nodiscard]] static ValueList _ask(sdbus::IProxy& proxy, const sdbus::MethodCall& message,
                                      std::chrono::milliseconds limit);
  void _note(const sdbus::Error& error);

  sdbus::IConnection& _bus;
  const std::string _owner;
  const std::string _title;
  const Clock& _clock;
  AgentLog& _log;
  const SteadyTime _deadline;
  bool _isSilent = false;
};

template <class... Arguments>
std::optional<ValueList> BusPeer::call(const PeerMethod& method, std::chrono::milliseconds limit,
                                       const Arguments&... arguments) {
  const auto granted = _limitOf(limit);
  if (!granted) return std::nullopt;
  try {
    const auto proxy = sdbus::createProxy(_bus, _owner, method.path);
    auto message = proxy->createMethodCall(method.interface, method.name);
    (void)(message << ... << arguments);
    return _ask(*proxy, message, *granted);
  } catch (const sdbus::Error& error) {
    _note(error);
    return std::nullopt;
  }
}

}  // namespace zal
