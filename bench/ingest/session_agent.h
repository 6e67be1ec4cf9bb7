#pragma once

#include <cstdint>
#include <filesystem>
#include <string>

#include "bench/support/child_process.h"
#include "bench/support/scratch_folder.h"
#include "client/lirra.h"

namespace zal::bench {

/// An agent that logs sessions, and one client of it with a session of the type "Bench".
class SessionAgent {
 public:
  /// Begins the session. The settings are further sections of the agent's configuration.
  SessionAgent(const std::filesystem::path& programs, const std::string& settings);
  ~SessionAgent();
  SessionAgent(const SessionAgent&) = delete;
  SessionAgent& operator=(const SessionAgent&) = delete;

  /// Why nothing can be measured; empty: it can.
  [[nodiscard]] const std::string& missing() const { return _missing; }
  [[nodiscard]] pid_t process() const { return _agent.id(); }
  [[nodiscard]] std::filesystem::path folder() const { return _folder.path(); }
  /// Descriptions with a text of 120 bytes and rising times, until the barrier behind the last one is
  /// answered. Returned: what went wrong, or nothing.
  [[nodiscard]] std::string send(std::uint64_t entries);
  void endSession();
  /// Kills the agent and starts it again, until that one listens; there is no client then. Returned: what
  /// went wrong, or nothing.
  [[nodiscard]] std::string cutOff();

 private:
  ScratchFolder _folder;
  ChildProcess::Options _options;
  ChildProcess _agent;
  std::string _socket;
  lirra_handle* _client = nullptr;
  std::string _missing;

  [[nodiscard]] bool _listensWithin(double seconds) const;
};

}  // namespace zal::bench
