#pragma once

#include <sys/types.h>

#include <atomic>
#include <string>
#include <thread>

namespace zal::testing {

/// Looks again and again what a loop's thread waits in. A loop waits in epoll alone; a question to a
/// daemon that waits for its answer does so in poll. So this tells whether the thread waited for
/// anybody, however slow the machine is.
class WaitWatch {
 public:
  /// Why the kernel does not show what a thread waits in; empty when it does.
  [[nodiscard]] static std::string obstacle();

  /// From now on. A process's main thread has the process's number.
  WaitWatch(pid_t process, pid_t thread);
  ~WaitWatch();
  WaitWatch(const WaitWatch&) = delete;
  WaitWatch& operator=(const WaitWatch&) = delete;

  /// Returns after a look that began after the call.
  void awaitLook() const;
  /// How often it waited in poll or select, since the beginning.
  [[nodiscard]] unsigned strayWaits() const { return _strayWaits; }

 private:
  void _watch(const std::string& place);

  std::atomic<bool> _stop = false;
  std::atomic<unsigned> _looks = 0;
  std::atomic<unsigned> _strayWaits = 0;
  std::thread _thread;
};

}  // namespace zal::testing
