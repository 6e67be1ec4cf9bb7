#pragma once

#include <functional>

#include "platform/process_exit.h"

namespace zal {

/// The real end. Runs the given last task (writing out what was accepted), flushes standard output
/// and ends the process without running destructors: other threads may be in the middle of jobs that
/// use the very objects that would go. What the last task throws is dropped, for the end must come.
class ImmediateProcessExit : public ProcessExit {
 public:
  explicit ImmediateProcessExit(std::function<void()> beforeExit);
  [[noreturn]] void exit(int status) override;

 private:
  std::function<void()> _beforeExit;
};

}  // namespace zal
