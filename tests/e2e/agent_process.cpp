#include "tests/e2e/agent_process.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>

#include "tests/e2e/raw_client.h"

namespace zal::testing {
namespace {

// The thread sanitizer keeps a signal until its thread comes by, and on a busy host it forgets one now and
// then: the agent waits in its loop, nothing is pending, and the next signal ends it. Without it none was
// ever lost.
#if defined(__SANITIZE_THREAD__)
constexpr bool kSignalsMayBeLost = true;
#elif defined(__has_feature)
constexpr bool kSignalsMayBeLost = __has_feature(thread_sanitizer);
#else
constexpr bool kSignalsMayBeLost = false;
#endif
constexpr std::chrono::seconds kNextSignal{5};

std::vector<char*> pointers(const std::vector<std::string>& words) {
  std::vector<char*> result;
  for (const std::string& word : words) result.push_back(const_cast<char*>(word.c_str()));
  result.push_back(nullptr);
  return result;
}

}  // namespace

AgentProcess::AgentProcess(const AgentSandbox& sandbox) : AgentProcess(sandbox, Options{}) {}

AgentProcess::AgentProcess(const AgentSandbox& sandbox, Options options) {
  std::vector<std::string> command = options.launcher;
  command.emplace_back(ZAL_AGENT_PATH);
  command.insert(command.end(), options.arguments.begin(), options.arguments.end());

  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  const std::string output = sandbox.outputFile();
  posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 1, output.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
  posix_spawn_file_actions_adddup2(&actions, 1, 2);
  const std::vector<std::string> environment = sandbox.environment();
  const int error = ::posix_spawnp(&_process, command[0].c_str(), &actions, nullptr, pointers(command).data(),
                                   pointers(environment).data());
  posix_spawn_file_actions_destroy(&actions);
  if (error != 0) throw std::runtime_error("cannot start " + command[0]);
  _processDescriptor = static_cast<int>(::syscall(SYS_pidfd_open, _process, 0));
  if (_processDescriptor < 0) throw std::runtime_error("no pidfd");
  if (!options.waitUntilListening) return;
  const bool listening = eventually([&] {
    return RawClient::canConnect(sandbox.socketPath()) || waitForExit(std::chrono::milliseconds{0});
  });
  if (!listening || _status) throw std::runtime_error("the agent does not listen: " + readFile(output));
}

AgentProcess::~AgentProcess() {
  if (!_status) {
    signal(SIGKILL);
    waitForExit();
  }
  ::close(_processDescriptor);
}

void AgentProcess::signal(int number) const { ::kill(_process, number); }

std::optional<int> AgentProcess::waitForExit(std::chrono::milliseconds deadline) {
  if (_status) return _status;
  pollfd ended{_processDescriptor, POLLIN, 0};
  int ready = 0;
  do {
    ready = ::poll(&ended, 1, static_cast<int>(deadline.count()));
  } while (ready < 0 && errno == EINTR);
  if (ready != 1) return std::nullopt;
  int status = 0;
  ::waitpid(_process, &status, 0);
  _status = WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
  return _status;
}

std::optional<int> AgentProcess::terminate() {
  const auto deadline = std::chrono::steady_clock::now() + kDeadline;
  do {
    signal(SIGTERM);
    if (const auto status = waitForExit(kSignalsMayBeLost ? kNextSignal : kDeadline)) return status;
  } while (kSignalsMayBeLost && std::chrono::steady_clock::now() < deadline);
  return std::nullopt;
}

}  // namespace zal::testing
