#pragma once

#include <cstddef>
#include <functional>
#include <list>
#include <memory>
#include <vector>

#include "platform/run_loop.h"
#include "platform/work_queue.h"
#include "session/session_log_writing.h"

namespace zal {

/// The files of ended sessions: there may be many lines or files from another file system, and the reference
/// time has to be asked for. They are written one after the other and away from the main thread. Main thread
/// only; loop and queues outlive it. What is unfinished at its end is not told.
class SessionWritings {
 public:
  using Finish = std::function<void(bool isWritten)>;
  SessionWritings(RunLoop& loop, WorkQueues& queues);
  SessionWritings(const SessionWritings&) = delete;
  SessionWritings& operator=(const SessionWritings&) = delete;

  /// `finish` is called once on the main thread, after the files of this one and of all before it.
  void begin(const std::shared_ptr<SessionLogWriting>& writing, Finish finish);
  /// How many there were.
  [[nodiscard]] std::size_t begun() const { return _begun; }
  /// Lets go of it once all that were begun are finished, at once when all are.
  void keepUntilFinished(std::shared_ptr<void> kept);
  /// Waits for all of them: for the end of the process.
  void finishAll();

 private:
  struct Pending {
    std::shared_ptr<SessionLogWriting> writing;
    Finish finish;
    std::vector<std::shared_ptr<void>> kept{};
  };
  void _finishFirst();

  RunLoop& _loop;
  const std::unique_ptr<WorkQueue> _queue;
  std::size_t _begun = 0;
  std::shared_ptr<std::list<Pending>> _pending = std::make_shared<std::list<Pending>>();
};

}  // namespace zal
