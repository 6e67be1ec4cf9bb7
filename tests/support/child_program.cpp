#include "tests/support/child_program.h"

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <thread>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// "R", "S", ...: what stands behind the name.
char stateOf(pid_t process) {
  const std::string text = readFile("/proc/" + std::to_string(process) + "/stat");
  const std::size_t name = text.rfind(')');
  return name != std::string::npos && name + 2 < text.size() ? text[name + 2] : '?';
}

}  // namespace

bool eventually(const std::function<bool()>& condition, std::chrono::milliseconds deadline) {
  const auto end = std::chrono::steady_clock::now() + deadline;
  while (!condition()) {
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  return true;
}

ChildProgram::ChildProgram(const Options& options) {
  std::vector<char*> arguments;
  for (const std::string& word : options.command) arguments.push_back(const_cast<char*>(word.c_str()));
  arguments.push_back(nullptr);
  _process = ::fork();
  if (_process != 0) return;
  const int input = ::open(options.input.c_str(), O_RDONLY);
  const int output = ::open(options.output.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
  const int errors = ::open(options.errors.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
  ::dup2(input, STDIN_FILENO);
  ::dup2(output, STDOUT_FILENO);
  ::dup2(errors, STDERR_FILENO);
  for (const auto& [name, value] : options.environment) ::setenv(name.c_str(), value.c_str(), 1);
  ::execv(arguments[0], arguments.data());
  ::_exit(127);
}

ChildProgram::~ChildProgram() {
  if (_status) return;
  ::kill(_process, SIGKILL);
  ::waitpid(_process, nullptr, 0);
}

void ChildProgram::signal(int number) const {
  ::kill(_process, number);
  siginfo_t stopped{};
  // Until then it may answer still.
  if (number == SIGSTOP) ::waitid(P_PID, static_cast<id_t>(_process), &stopped, WSTOPPED | WEXITED | WNOWAIT);
}

std::optional<int> ChildProgram::waitForExit() {
  int status = 0;
  if (!_status && eventually([&] { return ::waitpid(_process, &status, WNOHANG) == _process; }))
    _status = WIFEXITED(status) ? WEXITSTATUS(status) : -WTERMSIG(status);
  return _status;
}

bool ChildProgram::sleeps() const { return stateOf(_process) == 'S'; }

}  // namespace zal::testing
