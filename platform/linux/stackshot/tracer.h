#pragma once

#include <sys/types.h>

#include <chrono>
#include <system_error>
#include <vector>

namespace zal::stackshot {

/// Holds a thread of another process still, one at a time, without a signal to it: a stopped process
/// stays stopped and a sleeping call goes on, those few aside that report every stop as an interruption
/// (epoll_wait). All calls from one thread, as the kernel wants it. Whatever is held is let go at the
/// end, and by the kernel should this process die.
class Tracer {
 public:
  using TimePoint = std::chrono::steady_clock::time_point;

  Tracer();
  ~Tracer();
  Tracer(const Tracer&) = delete;
  Tracer& operator=(const Tracer&) = delete;

  /// Returns when the thread is held; nothing else is held then. Returned: why it is not; timed_out when
  /// it did not stop until the end, in which case it is let go as soon as it does.
  [[nodiscard]] std::error_code hold(pid_t thread, TimePoint end);
  void letGo();

 private:
  enum class Seen { running, stopped, gone };

  Seen _look(pid_t thread);
  void _detach(pid_t thread) const;
  void _letGoLateOnes();

  pid_t _held = 0;
  int _signalInHand = 0;     // what the thread was about to get; it gets it when let go
  std::vector<pid_t> _late;  // asked to stop, not seen stopped yet
};

}  // namespace zal::stackshot
