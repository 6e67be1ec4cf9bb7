#pragma once

#include <functional>

namespace zal {

/// What the host's operator asks of the whole process. Main thread only; handlers run on it, from
/// the run loop, for as long as the service lives. One handler each: a later one replaces it.
class HostSignals {
 public:
  virtual ~HostSignals() = default;
  /// The process is to end in good order, soon. Every peer was told before the handler runs.
  virtual void onTerminate(std::function<void()> handler) = 0;
  /// What is stored is to be read again.
  virtual void onReload(std::function<void()> handler) = 0;
};

}  // namespace zal
