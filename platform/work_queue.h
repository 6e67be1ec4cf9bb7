#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>

namespace zal {

/// One queue of jobs that run away from the main thread (or on it: see WorkQueues::main).
/// Any thread. A job that was accepted runs even when the queue object is gone by then.
class WorkQueue {
 public:
  using Job = std::function<void()>;
  virtual ~WorkQueue() = default;
  [[nodiscard]] virtual const std::string& label() const = 0;
  /// Returns at once; the job runs later, never inside the call.
  virtual void async(Job job) = 0;
  /// The same after a delay of steady time. The wait is a timer and holds no thread.
  virtual void asyncAfter(std::chrono::nanoseconds delay, Job job) = 0;
};

enum class QueuePriority {
  standard,
  background,  ///< nice 19 and idle I/O: never in the way of a call
};

/// The process's queues. Any thread.
class WorkQueues {
 public:
  virtual ~WorkQueues() = default;
  /// Jobs run one at a time on the main run loop.
  virtual WorkQueue& main() = 0;
  /// Concurrent: jobs may run side by side and in any order.
  virtual WorkQueue& global(QueuePriority priority) = 0;
  /// Jobs run one at a time, in the order given, on threads of the global queue of that priority.
  virtual std::unique_ptr<WorkQueue> makeSerial(std::string label,
                                                QueuePriority priority = QueuePriority::standard) = 0;
};

}  // namespace zal
