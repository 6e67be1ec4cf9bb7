#pragma once

#include <sys/types.h>

#include <chrono>
#include <cstddef>
#include <optional>

#include "platform/linux/stackshot/records.h"
#include "platform/linux/stackshot/symbol_cache.h"
#include "platform/linux/stackshot/time_left.h"
#include "platform/linux/stackshot/tracer.h"

namespace zal::stackshot {

class StackReader;

struct SurveyLimits {
  std::chrono::milliseconds toStop{100};  ///< for one thread to stop
  std::chrono::milliseconds process{1000};
  std::size_t frames = 256;   ///< of one thread
  std::size_t threads = 512;  ///< of one process
};

/// Reads processes with the stacks of their threads, one thread after the other: each is held while its
/// own stack is read and no longer. Where that cannot be, the kernel's side of the thread and the reason.
class Survey {
 public:
  explicit Survey(const TimeLeft& timeLeft, SurveyLimits limits = {})
      : _timeLeft(timeLeft), _limits(limits) {}

  /// Nothing when there is no such process.
  [[nodiscard]] std::optional<ProcessRecord> process(pid_t id);
  /// The longest time that a thread was held so far.
  [[nodiscard]] std::chrono::nanoseconds longestHold() const { return _longestHold; }

 private:
  void _readStacks(ProcessRecord& process);
  void _readStack(StackReader& reader, const ProcessRecord& process, ThreadRecord& thread,
                  Tracer::TimePoint end);
  [[nodiscard]] std::error_code _hold(const ProcessRecord& process, pid_t thread);

  const TimeLeft& _timeLeft;
  const SurveyLimits _limits;
  Tracer _tracer;
  SymbolCache _symbols;
  std::chrono::nanoseconds _longestHold{0};
};

}  // namespace zal::stackshot
