#include "tests/linux/stackshot/target_process.h"

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>

#include "platform/linux/stackshot/process_files.h"
#include "tests/support/child_program.h"

namespace zal::testing {

TargetProcess::TargetProcess(const std::string& word, int output)
    : TargetProcess([&] {
        if (output >= 0) ::dup2(output, STDOUT_FILENO);
        ::execl(ZAL_STACKSHOT_TARGET, ZAL_STACKSHOT_TARGET, word.c_str(), nullptr);
        ::_exit(127);
      }) {
  _name = "stackshot_targe";  // the kernel keeps 15 bytes
}

TargetProcess::TargetProcess(const std::function<void()>& body) : _id(::fork()) {
  if (_id != 0) return;
  ::prctl(PR_SET_PDEATHSIG, SIGKILL);
  body();
  ::_exit(0);
}

TargetProcess::~TargetProcess() {
  if (_id <= 0) return;
  ::kill(_id, SIGKILL);
  ::waitpid(_id, nullptr, 0);
}

void TargetProcess::signal(int number) const { ::kill(_id, number); }

bool TargetProcess::becomes(const std::string& wanted) const {
  return eventually([&] { return states() == wanted; });
}

std::string TargetProcess::states() const {
  std::string result;
  const auto process = stackshot::readProcess(_id);
  if (!process || (!_name.empty() && process->name != _name)) return result;
  for (const pid_t thread : stackshot::threadsOf(_id)) result += stackshot::stateOf(_id, thread);
  return result;
}

bool TargetProcess::isFree() const {
  const auto threads = stackshot::threadsOf(_id);
  return std::all_of(threads.begin(), threads.end(),
                     [this](pid_t thread) { return stackshot::tracerOf(_id, thread) == 0; });
}

int TargetProcess::end() {
  int status = -1;
  ::waitpid(_id, &status, 0);
  _id = -1;
  return status;
}

}  // namespace zal::testing
