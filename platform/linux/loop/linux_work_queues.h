#pragma once

#include <memory>

#include "platform/linux/loop/thread_pool.h"
#include "platform/run_loop.h"
#include "platform/work_queue.h"

namespace zal {

/// The process's queues, on two pools of threads that come into being with their first jobs: one at
/// ordinary priority, one at nice 19 with idle I/O. What a job throws is caught and told to the
/// failure handler, except on the main queue, whose jobs are tasks of the run loop.
///
/// The end: jobs accepted so far still run, and so do those that they give to their own pool; jobs
/// whose delay has not passed are dropped; then the threads are joined. So it ends before whatever
/// its jobs use, and never on a thread of its own. Serial queues may outlive it; what they are given
/// then is dropped. The loop outlives it.
class LinuxWorkQueues : public WorkQueues {
 public:
  /// Gets a line worth a warning; runs on any thread and must not throw.
  using FailureHandler = ThreadPool::FailureHandler;
  LinuxWorkQueues(RunLoop& loop, FailureHandler onFailure);
  ~LinuxWorkQueues() override;

  WorkQueue& main() override;
  WorkQueue& global(QueuePriority priority) override;
  std::unique_ptr<WorkQueue> makeSerial(std::string label, QueuePriority priority) override;

 private:
  // Shared with the queues, whose strands refer to the pool's insides.
  std::shared_ptr<ThreadPool> _standardPool, _backgroundPool;
  std::unique_ptr<WorkQueue> _main, _standard, _background;
};

}  // namespace zal
