#include "platform/linux/archive/worker_threads.h"

#include <pthread.h>
#include <signal.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <system_error>

namespace zal {
namespace {

constexpr std::size_t kMostThreads = 4;
constexpr int kNice = 10;

}  // namespace

std::size_t archiveThreads() {
  return std::clamp<std::size_t>(std::thread::hardware_concurrency(), 1, kMostThreads);
}

WorkerThreads::WorkerThreads(std::size_t count, const std::function<void(std::size_t)>& work) {
  for (std::size_t number = 0; number < count; ++number) {
    try {
      _threads.emplace_back([work, number] {
        sigset_t all;
        ::sigfillset(&all);
        ::pthread_sigmask(SIG_SETMASK, &all, nullptr);
        ::pthread_setname_np(::pthread_self(), "zal-archive");
        // Of this thread alone. An agent that was started lower already stays where it is.
        const auto thread = static_cast<id_t>(::gettid());
        if (::getpriority(PRIO_PROCESS, thread) < kNice) ::setpriority(PRIO_PROCESS, thread, kNice);
        work(number);
      });
    } catch (const std::system_error&) {
      if (_threads.empty()) throw;
      return;
    }
  }
}

void WorkerThreads::join() {
  for (std::thread& thread : _threads) {
    if (thread.joinable()) thread.join();
  }
}

}  // namespace zal
