#pragma once

#include <string>

#include "platform/agent_log.h"
#include "platform/system_shell.h"

namespace zal {

/// The shell as a child of its own. Any thread, several at once: each call waits for its own child
/// alone, so that no child is ever taken from another waiter. The command inherits the variables that are
/// for children (child_environment.h), the working directory, standard output and error, and the calling
/// thread's priority.
class PosixShell : public SystemShell {
 public:
  /// Takes back an ignored SIGCHLD, which a parent may have left to us: the kernel would then throw
  /// every exit status away. The shell's path is for tests.
  explicit PosixShell(AgentLog& log, std::string shell = "/bin/sh");
  int PerformSystem(const std::string& commandLine) override;

 private:
  AgentLog& _log;
  const std::string _shell;
};

}  // namespace zal
