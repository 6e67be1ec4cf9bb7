#pragma once

#include <sys/types.h>

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "tests/e2e/agent_sandbox.h"

namespace zal::testing {

/// The real daemon as a child process. Killed at the end if it still runs.
class AgentProcess {
 public:
  struct Options {
    std::vector<std::string> arguments;
    std::vector<std::string> launcher;  ///< a command that executes the daemon; its words come first
    bool waitUntilListening = true;
  };

  /// Its output goes to the end of the sandbox's output file.
  AgentProcess(const AgentSandbox& sandbox, Options options);
  explicit AgentProcess(const AgentSandbox& sandbox);
  ~AgentProcess();
  AgentProcess(const AgentProcess&) = delete;
  AgentProcess& operator=(const AgentProcess&) = delete;

  [[nodiscard]] pid_t processId() const { return _process; }
  void signal(int number) const;
  /// The exit status, or minus the signal that killed it; nothing when it runs beyond the deadline.
  std::optional<int> waitForExit(std::chrono::milliseconds deadline = kDeadline);
  /// SIGTERM and wait.
  std::optional<int> terminate();

 private:
  pid_t _process = -1;
  int _processDescriptor = -1;
  std::optional<int> _status;
};

}  // namespace zal::testing
