#pragma once

#include <condition_variable>
#include <cstddef>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "platform/system_shell.h"
#include "platform/work_queue.h"

namespace zal {

/// A shell whose background lines cost the thread that made it nothing: starting one takes a
/// millisecond, and a collection starts a dozen. They run one after the other, in the order given, on
/// a queue of their own. Other threads wait as ever, so that a command keeps its thread's priority.
/// Any thread.
class QueueingShell : public SystemShell {
 public:
  /// Both are borrowed and outlive every line that is still queued.
  QueueingShell(SystemShell& shell, WorkQueues& queues);
  ~QueueingShell() override;
  QueueingShell(const QueueingShell&) = delete;
  QueueingShell& operator=(const QueueingShell&) = delete;
  int PerformSystem(const std::string& commandLine) override;
  void performSystemInBackground(const std::string& commandLine) override;
  /// Before the process ends: what was accepted is started, if that is possible in a few seconds.
  void startWhatIsQueued();

 private:
  void _started();

  SystemShell& _shell;
  WorkQueues& _queues;
  const std::thread::id _spared = std::this_thread::get_id();
  std::unique_ptr<WorkQueue> _queue;  ///< made at its first use, on the spared thread
  std::mutex _lock;
  std::condition_variable _allStarted;
  std::size_t _waiting = 0;  ///< guarded by _lock
};

}  // namespace zal
