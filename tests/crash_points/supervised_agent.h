#pragma once

#include <linux/seccomp.h>
#include <sys/types.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <thread>

#include "platform/linux/files/descriptor.h"
#include "tests/crash_points/system_calls.h"
#include "tests/e2e/agent_sandbox.h"

namespace zal::testing {

/// What becomes of one system call of the agent.
struct Judgement {
  enum class Kind {
    passes,
    fails,          ///< with `error`, without having happened
    kills,          ///< the agent ends without having made it
    tearsAndKills,  ///< the first `bytes` of a write happen, then the agent ends
    shortens,       ///< the first `bytes` of a write happen, and the agent is told so
  };
  Kind kind = Kind::passes;
  int error = 0;
  std::size_t bytes = 0;
};

/// The real daemon, asked before each watched call of any of its threads. What its children call passes.
class SupervisedAgent {
 public:
  /// On a thread of the supervisor.
  using Judge = std::function<Judgement(pid_t process, const WatchedCall& call, const seccomp_data& data)>;

  SupervisedAgent(const AgentSandbox& sandbox, const std::vector<WatchedCall>& calls, Judge judge);
  /// Kills it if it still runs, and lets its children end.
  ~SupervisedAgent();
  SupervisedAgent(const SupervisedAgent&) = delete;
  SupervisedAgent& operator=(const SupervisedAgent&) = delete;

  /// Whether this host lets a process ask about another one's system calls.
  [[nodiscard]] static bool isPossible();
  [[nodiscard]] bool hasEnded() const;
  [[nodiscard]] pid_t processId() const { return _process; }
  void signal(int number) const;
  /// The exit status, or minus the signal that killed it; nothing when it runs beyond the deadline.
  std::optional<int> waitForExit(std::chrono::milliseconds deadline);
  /// The descriptor of the agent's that has this number, as our own.
  [[nodiscard]] Descriptor borrow(int descriptor) const;

 private:
  void _start(const AgentSandbox& sandbox);
  void _supervise();
  void _answer(const struct seccomp_notif& question);
  [[nodiscard]] bool _isOurs(pid_t thread) const;
  std::size_t _writeFirst(const seccomp_data& data, std::size_t bytes) const;

  const std::vector<WatchedCall>& _watched;
  Judge _judge;
  pid_t _process = -1;
  Descriptor _processDescriptor;
  Descriptor _listener;
  Descriptor _stop;
  std::optional<int> _status;
  std::thread _supervisor;
};

}  // namespace zal::testing
