#pragma once

#include <signal.h>

namespace zal {

/// All signals are blocked in this thread as long as it lives, and for good in threads that are made
/// meanwhile, which inherit their maker's mask: the main thread gets the signals.
class AllSignalsBlocked {
 public:
  AllSignalsBlocked() {
    sigset_t all;
    ::sigfillset(&all);
    ::pthread_sigmask(SIG_SETMASK, &all, &_before);
  }
  ~AllSignalsBlocked() { ::pthread_sigmask(SIG_SETMASK, &_before, nullptr); }
  AllSignalsBlocked(const AllSignalsBlocked&) = delete;
  AllSignalsBlocked& operator=(const AllSignalsBlocked&) = delete;

 private:
  sigset_t _before{};
};

}  // namespace zal
