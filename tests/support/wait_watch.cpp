#include "tests/support/wait_watch.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <fstream>

namespace zal::testing {
namespace {

/// Shorter than any limit of a call; long enough to leave a processor to others.
constexpr std::chrono::microseconds kPause{300};
/// Those without a number are not in this kernel's table.
constexpr std::array kStrayCalls = {
    SYS_ppoll,
    SYS_pselect6,
#ifdef SYS_poll
    SYS_poll,
    SYS_select,
#endif
};

std::string placeOf(pid_t process, pid_t thread) {
  return "/proc/" + std::to_string(process) + "/task/" + std::to_string(thread) + "/syscall";
}

/// The first word: the call's number, or "running".
std::string wordIn(const std::string& place) {
  std::string word;
  std::ifstream(place) >> word;
  return word;
}

}  // namespace

std::string WaitWatch::obstacle() {
  const bool isShown = !wordIn(placeOf(::getpid(), static_cast<pid_t>(::syscall(SYS_gettid)))).empty();
  return isShown ? "" : "the kernel does not show what a thread waits in";
}

WaitWatch::WaitWatch(pid_t process, pid_t thread)
    : _thread([this, place = placeOf(process, thread)] { _watch(place); }) {}

WaitWatch::~WaitWatch() {
  _stop = true;
  _thread.join();
}

void WaitWatch::awaitLook() const {
  // Two: the first may have begun before.
  const unsigned now = _looks;
  while (_looks < now + 2) std::this_thread::yield();
}

void WaitWatch::_watch(const std::string& place) {
  while (!_stop) {
    const std::string word = wordIn(place);
    const bool isStray =
        !word.empty() && word.front() >= '0' && word.front() <= '9' &&
        std::find(kStrayCalls.begin(), kStrayCalls.end(), std::atol(word.c_str())) != kStrayCalls.end();
    if (isStray) ++_strayWaits;
    ++_looks;
    std::this_thread::sleep_for(kPause);
  }
}

}  // namespace zal::testing
