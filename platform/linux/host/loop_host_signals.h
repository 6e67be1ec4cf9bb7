#pragma once

#include <functional>

#include "platform/host_signals.h"
#include "platform/linux/loop/linux_run_loop.h"

namespace zal {

/// SIGTERM and SIGHUP, delivered as tasks of the main loop. Main thread only; the loop outlives it.
class LoopHostSignals : public HostSignals {
 public:
  /// `announceTermination` runs before the handler does.
  LoopHostSignals(LinuxRunLoop& loop, std::function<void()> announceTermination);
  LoopHostSignals(const LoopHostSignals&) = delete;
  LoopHostSignals& operator=(const LoopHostSignals&) = delete;

  void onTerminate(std::function<void()> handler) override { _terminate = std::move(handler); }
  void onReload(std::function<void()> handler) override { _reload = std::move(handler); }

 private:
  std::function<void()> _announceTermination;
  std::function<void()> _terminate = [] {};
  std::function<void()> _reload = [] {};
};

}  // namespace zal
