#include "platform/linux/stackshot/tracer.h"

#include <sys/ptrace.h>
#include <sys/wait.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <ctime>

#include "platform/linux/files/system_error.h"

namespace zal::stackshot {
namespace {

/// The kernel announces a stop with SIGCHLD, which is blocked. Returns early for that.
void waitForNews(std::chrono::nanoseconds most) {
  sigset_t news;
  ::sigemptyset(&news);
  ::sigaddset(&news, SIGCHLD);
  // A moment at most: announcements of two threads may be delivered as one.
  most = std::min<std::chrono::nanoseconds>(most, std::chrono::milliseconds(5));
  const timespec limit{.tv_sec = 0, .tv_nsec = most.count()};
  ::sigtimedwait(&news, nullptr, &limit);
}

}  // namespace

Tracer::Tracer() {
  sigset_t news;
  ::sigemptyset(&news);
  ::sigaddset(&news, SIGCHLD);
  ::sigprocmask(SIG_BLOCK, &news, nullptr);
}

Tracer::~Tracer() {
  letGo();
  _letGoLateOnes();
}

std::error_code Tracer::hold(pid_t thread, TimePoint end) {
  letGo();
  _letGoLateOnes();
  if (::ptrace(PTRACE_SEIZE, thread, nullptr, nullptr) != 0) return lastSystemError();
  if (::ptrace(PTRACE_INTERRUPT, thread, nullptr, nullptr) != 0 && errno != EIO) {
    _late.push_back(thread);  // it may be ending just now
    return lastSystemError();
  }
  while (true) {
    const Seen seen = _look(thread);
    if (seen == Seen::gone) return std::make_error_code(std::errc::no_such_process);
    if (seen == Seen::stopped) {
      _held = thread;
      return {};
    }
    const auto left = end - std::chrono::steady_clock::now();
    if (left <= std::chrono::nanoseconds(0)) {
      _late.push_back(thread);
      return std::make_error_code(std::errc::timed_out);
    }
    waitForNews(left);
  }
}

void Tracer::letGo() {
  if (_held == 0) return;
  _detach(_held);
  _held = 0;
}

Tracer::Seen Tracer::_look(pid_t thread) {
  int status = 0;
  const pid_t seen = ::waitpid(thread, &status, __WALL | WNOHANG);
  if (seen == 0 || (seen < 0 && errno == EINTR)) return Seen::running;
  if (seen < 0 || !WIFSTOPPED(status)) return Seen::gone;
  // Without an event behind it the stop is that of a signal on its way to the thread.
  _signalInHand = (status >> 16) == 0 ? WSTOPSIG(status) : 0;
  return Seen::stopped;
}

void Tracer::_detach(pid_t thread) const {
  ::ptrace(PTRACE_DETACH, thread, nullptr, reinterpret_cast<void*>(static_cast<long>(_signalInHand)));
}

void Tracer::_letGoLateOnes() {
  std::erase_if(_late, [this](pid_t thread) {
    const Seen seen = _look(thread);
    if (seen == Seen::stopped) _detach(thread);
    return seen != Seen::running;
  });
}

}  // namespace zal::stackshot
