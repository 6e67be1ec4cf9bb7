#include "platform/linux/helper/patience.h"

#include <sys/signalfd.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <limits>
#include <system_error>
#include <vector>

#include "platform/linux/files/system_error.h"

namespace zal::helper {

int pollLimit(SteadyMoment until) {
  const auto left =
      std::chrono::ceil<std::chrono::milliseconds>(until - std::chrono::steady_clock::now()).count();
  return static_cast<int>(std::clamp<long long>(left, 0, std::numeric_limits<int>::max()));
}

Patience::Patience(std::chrono::milliseconds whole)
    : _end(std::chrono::steady_clock::now() + whole), _whole(whole) {
  sigset_t signals;
  ::sigemptyset(&signals);
  for (const int signal : {SIGTERM, SIGINT, SIGHUP, SIGQUIT}) ::sigaddset(&signals, signal);
  ::sigprocmask(SIG_BLOCK, &signals, nullptr);
  _signals = Descriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
  if (!_signals.isOpen()) throw std::system_error(lastSystemError(), "signalfd");
}

bool Patience::isOver() {
  if (!_reason.empty()) return true;
  signalfd_siginfo signal{};
  if (::read(_signals.get(), &signal, sizeof signal) == sizeof signal) {
    _reason = "told to end by signal " + std::to_string(signal.ssi_signo);
  } else if (std::chrono::steady_clock::now() >= _end) {
    _reason = "its time of " + std::to_string(_whole.count()) + " ms was up";
  }
  return !_reason.empty();
}

bool Patience::await(std::span<pollfd> descriptors, SteadyMoment until) {
  std::vector<pollfd> all(descriptors.begin(), descriptors.end());
  all.push_back({.fd = _signals.get(), .events = POLLIN, .revents = 0});
  while (!isOver()) {
    const int ready = ::poll(all.data(), all.size(), pollLimit(std::min(until, _end)));
    std::copy_n(all.begin(), descriptors.size(), descriptors.begin());
    if (ready > 0 && std::any_of(descriptors.begin(), descriptors.end(),
                                 [](const pollfd& one) { return one.revents != 0; }))
      return true;
    if (std::chrono::steady_clock::now() >= until) return false;
  }
  return false;
}

void Patience::pause(std::chrono::milliseconds length) {
  (void)await({}, std::chrono::steady_clock::now() + length);
}

}  // namespace zal::helper
