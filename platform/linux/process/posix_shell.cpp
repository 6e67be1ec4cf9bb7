#include "platform/linux/process/posix_shell.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>
#include <utility>

namespace zal {

namespace {

constexpr int kFirstPrivateDescriptor = 3;

/// What the child does before it becomes the shell.
class SpawnPlan {
 public:
  SpawnPlan() {
    ::posix_spawn_file_actions_init(&_actions);
    ::posix_spawn_file_actions_addopen(&_actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    // A background command outlives us and must not hold our listener or our logs.
    ::posix_spawn_file_actions_addclosefrom_np(&_actions, kFirstPrivateDescriptor);
    ::posix_spawnattr_init(&_attributes);
    sigset_t signals;
    ::sigemptyset(&signals);
    ::posix_spawnattr_setsigmask(&_attributes, &signals);
    ::sigfillset(&signals);
    ::posix_spawnattr_setsigdefault(&_attributes, &signals);
    ::posix_spawnattr_setflags(&_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  }
  ~SpawnPlan() {
    ::posix_spawn_file_actions_destroy(&_actions);
    ::posix_spawnattr_destroy(&_attributes);
  }
  SpawnPlan(const SpawnPlan&) = delete;
  SpawnPlan& operator=(const SpawnPlan&) = delete;

  /// Zero, or why there is no child.
  int start(pid_t& child, const std::string& shell, const std::string& commandLine) const {
    std::string name = "sh", flag = "-c", line = commandLine;
    char* arguments[] = {name.data(), flag.data(), line.data(), nullptr};
    return ::posix_spawn(&child, shell.c_str(), &_actions, &_attributes, arguments, environ);
  }

 private:
  posix_spawn_file_actions_t _actions{};
  posix_spawnattr_t _attributes{};
};

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
  if (const int error = SpawnPlan().start(child, _shell, commandLine)) {
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
