#pragma once

#include <functional>
#include <list>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <asio/any_io_executor.hpp>
#include <asio/executor_work_guard.hpp>
#include <asio/io_context.hpp>
#include <asio/steady_timer.hpp>

#include "platform/work_queue.h"

namespace zal {

/// Threads that run jobs. Any thread. A thread is made when a job comes that no idle one could take,
/// up to the limit; all signals are blocked in them, so that the main thread gets those.
class ThreadPool {
 public:
  using Job = WorkQueue::Job;
  /// Gets one line; runs on any thread and must not throw.
  using FailureHandler = std::function<void(std::string_view)>;
  struct Options {
    std::string threadName;  ///< at most 12 bytes; a number is appended
    std::size_t maximumThreads = 1;
    QueuePriority priority = QueuePriority::standard;
  };

  /// The handler hears of jobs that threw and of a priority that could not be set.
  ThreadPool(Options options, FailureHandler onFailure);
  ~ThreadPool() { close(); }
  ThreadPool(const ThreadPool&) = delete;
  ThreadPool& operator=(const ThreadPool&) = delete;

  /// Runs the jobs accepted so far to their end, and those they submit; drops those whose delay has
  /// not passed; joins. What comes later is dropped. Never on a thread of the pool.
  void close();
  /// What runs jobs side by side; strands are made from it.
  [[nodiscard]] asio::any_io_executor executor() { return _context.get_executor(); }
  /// Runs the job on the pool through `where`, the pool's executor or a strand of it. The queue's
  /// name is for the failure line. Throws std::system_error when not even one thread can be made.
  void submit(const asio::any_io_executor& where, const std::string& queue, Job job);
  /// The same after the delay; the wait holds no thread.
  void submitAfter(std::chrono::nanoseconds delay, const asio::any_io_executor& where,
                   const std::string& queue, Job job);

 private:
  void _startThread();
  void _runThread(std::size_t number);
  void _runJob(const std::string& queue, const Job& job);

  const Options _options;
  const FailureHandler _onFailure;
  asio::io_context _context;
  asio::executor_work_guard<asio::io_context::executor_type> _keepRunning{_context.get_executor()};
  std::mutex _mutex;
  // Guarded by _mutex from here on.
  std::size_t _unfinished = 0;  // jobs not yet run to their end, those still waiting for a delay left out
  bool _closing = false, _closed = false;
  std::list<asio::steady_timer> _delays;
  std::vector<std::thread> _threads;
};

}  // namespace zal
