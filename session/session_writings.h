#pragma once

#include <functional>
#include <list>
#include <memory>

#include "platform/run_loop.h"
#include "platform/work_queue.h"
#include "session/session_log_writing.h"

namespace zal {

/// Ended sessions whose files take long, as there are many lines or files from another file system: they are
/// written one after the other and away from the main thread. Main thread only; loop and queues outlive it.
/// What is unfinished at its end is not told.
class SessionWritings {
 public:
  using Finish = std::function<void(bool isWritten)>;
  SessionWritings(RunLoop& loop, WorkQueues& queues);
  SessionWritings(const SessionWritings&) = delete;
  SessionWritings& operator=(const SessionWritings&) = delete;

  /// `finish` is called once on the main thread, after the files of this one and of all before it.
  void begin(std::shared_ptr<SessionLogWriting> writing, Finish finish);
  /// Waits for all of them: for the end of the process.
  void finishAll();

 private:
  struct Pending {
    std::shared_ptr<SessionLogWriting> writing;
    Finish finish;
  };
  void _finishFirst();

  RunLoop& _loop;
  const std::unique_ptr<WorkQueue> _queue;
  std::shared_ptr<std::list<Pending>> _pending = std::make_shared<std::list<Pending>>();
};

}  // namespace zal
