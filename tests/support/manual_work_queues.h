#pragma once

#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <utility>

#include "platform/work_queue.h"
#include "tests/support/manual_run_loop.h"

namespace zal::testing {

/// Queues whose jobs run when the test says so: both orders of a race are ordinary tests.
class ManualWorkQueues : public WorkQueues {
 public:
  explicit ManualWorkQueues(ManualRunLoop& loop);
  ~ManualWorkQueues() override;

  WorkQueue& main() override;
  WorkQueue& global(QueuePriority priority) override;
  std::unique_ptr<WorkQueue> makeSerial(std::string label, QueuePriority priority) override;

  /// Runs the oldest ready job of the queue with that label; false when it has none. The globals
  /// are called "global.default" and "global.background".
  bool runNext(const std::string& label);
  /// Runs ready jobs of all queues, oldest first, and posted main tasks, until none is left.
  void runAll();
  [[nodiscard]] std::size_t readyJobs(const std::string& label) const;

 private:
  class Queue;
  struct Ready {
    std::string label;
    WorkQueue::Job job;
  };
  ManualRunLoop& _loop;
  mutable std::mutex _mutex;
  std::deque<Ready> _ready;
  std::unique_ptr<Queue> _main, _default, _background;
};

}  // namespace zal::testing
