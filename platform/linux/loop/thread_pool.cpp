#include "platform/linux/loop/thread_pool.h"

#include <pthread.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <exception>
#include <system_error>
#include <utility>

#include <asio/post.hpp>

#include "platform/linux/process/all_signals_blocked.h"

namespace zal {

namespace {

// From the kernel's ioprio interface, for which the C library has no names.
constexpr int kIoPriorityWhoProcess = 1;
constexpr int kIoPriorityClassIdle = 3;
constexpr int kIoPriorityClassShift = 13;
constexpr int kLowestNice = 19;

constexpr std::chrono::nanoseconds kLongestQueueDelay = std::chrono::hours{24 * 365 * 100};

/// Of the calling thread alone: on Linux both are per thread. Children inherit them.
std::error_code becomeBackgroundThread() {
  const auto thread = static_cast<id_t>(::syscall(SYS_gettid));
  if (::setpriority(PRIO_PROCESS, thread, kLowestNice) != 0) return {errno, std::generic_category()};
  if (::syscall(SYS_ioprio_set, kIoPriorityWhoProcess, 0, kIoPriorityClassIdle << kIoPriorityClassShift) !=
      0) {
    return {errno, std::generic_category()};
  }
  return {};
}

}  // namespace

ThreadPool::ThreadPool(Options options, FailureHandler onFailure)
    : _options(std::move(options)), _onFailure(std::move(onFailure)) {}

void ThreadPool::close() {
  {
    const std::scoped_lock lock(_mutex);
    _closing = true;
    for (auto& delay : _delays) delay.cancel();
  }
  _keepRunning.reset();
  for (auto& thread : _threads) thread.join();  // while closing no thread is added
  const std::scoped_lock lock(_mutex);
  _threads.clear();
  _closed = true;
}

void ThreadPool::submit(const asio::any_io_executor& where, const std::string& queue, Job job) {
  {
    const std::scoped_lock lock(_mutex);
    if (_closed) return;
    if (_unfinished >= _threads.size()) _startThread();
    ++_unfinished;
  }
  asio::post(where, [this, queue, job = std::move(job)] { _runJob(queue, job); });
}

void ThreadPool::submitAfter(std::chrono::nanoseconds delay, const asio::any_io_executor& where,
                             const std::string& queue, Job job) {
  const std::scoped_lock lock(_mutex);
  if (_closing) return;
  if (_threads.empty()) _startThread();  // somebody must notice that the delay has passed
  _delays.emplace_front(_context, std::min(delay, kLongestQueueDelay));
  _delays.front().async_wait([this, position = _delays.begin(), where, queue,
                              job = std::move(job)](const std::error_code& error) mutable {
    {
      const std::scoped_lock relock(_mutex);
      _delays.erase(position);
    }
    if (!error) submit(where, queue, std::move(job));
  });
}

void ThreadPool::_startThread() {
  if (_closing || _threads.size() >= _options.maximumThreads) return;
  const AllSignalsBlocked blocked;
  constexpr int kMostAttempts = 3;
  for (int attempt = 1;; ++attempt) {
    try {
      _threads.emplace_back([this, number = _threads.size() + 1] { _runThread(number); });
      return;
    } catch (const std::system_error&) {
      if (!_threads.empty()) return;  // the others take the job, later
      // Without any the job's owner fails: not for a moment in which the host has no room.
      if (attempt == kMostAttempts) throw;
    }
  }
}

void ThreadPool::_runThread(std::size_t number) {
  ::pthread_setname_np(::pthread_self(), (_options.threadName + '-' + std::to_string(number)).c_str());
  if (_options.priority == QueuePriority::background) {
    if (const auto error = becomeBackgroundThread()) {
      _onFailure("A background thread keeps its ordinary priority: " + error.message());
    }
  }
  _context.run();
}

void ThreadPool::_runJob(const std::string& queue, const Job& job) {
  try {
    job();
  } catch (const std::exception& error) {
    _onFailure("A job on the queue " + queue + " ended by an exception: " + error.what());
  } catch (...) {
    _onFailure("A job on the queue " + queue + " ended by an exception of an unknown kind");
  }
  const std::scoped_lock lock(_mutex);
  --_unfinished;
}

}  // namespace zal
