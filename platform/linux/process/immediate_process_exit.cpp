#include "platform/linux/process/immediate_process_exit.h"

#include <unistd.h>

#include <cstdio>
#include <utility>

namespace zal {

ImmediateProcessExit::ImmediateProcessExit(std::function<void()> beforeExit)
    : _beforeExit(std::move(beforeExit)) {}

void ImmediateProcessExit::exit(int status) {
  // Taken out first: a last task that asks for the end itself gets it.
  const auto lastTask = std::exchange(_beforeExit, nullptr);
  try {
    if (lastTask) lastTask();
  } catch (...) {  // NOLINT(bugprone-empty-catch)
  }
  std::fflush(stdout);
  ::_exit(status);
}

}  // namespace zal
