#include "platform/linux/process/posix_shell.h"

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>
#include <utility>

#include "platform/linux/process/child_environment.h"
#include "platform/linux/process/child_setup.h"

namespace zal {

namespace {

std::string reason(int error) { return std::generic_category().message(error); }

}  // namespace

PosixShell::PosixShell(AgentLog& log, std::string shell) : _log(log), _shell(std::move(shell)) {
  struct sigaction current {};
  if (::sigaction(SIGCHLD, nullptr, &current) == 0 && current.sa_handler == SIG_IGN) {
    current.sa_handler = SIG_DFL;
    ::sigaction(SIGCHLD, &current, nullptr);
  }
}

int PosixShell::PerformSystem(const std::string& commandLine) {
  pid_t child = -1;
  if (const int error =
          ChildSetup().start(child, _shell, {"sh", "-c", commandLine}, ChildEnvironment().pointers())) {
    _log.warning("Could not start " + _shell + ": " + reason(error));
    return -1;
  }
  int status = 0;
  pid_t ended = -1;
  do {
    ended = ::waitpid(child, &status, 0);
  } while (ended < 0 && errno == EINTR);
  if (ended == child) return status;
  _log.warning("Could not learn how " + _shell + " ended: " + reason(errno));
  return -1;
}

}  // namespace zal
