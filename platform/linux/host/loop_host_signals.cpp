#include "platform/linux/host/loop_host_signals.h"

#include <csignal>

namespace zal {

LoopHostSignals::LoopHostSignals(LinuxRunLoop& loop, std::function<void()> announceTermination)
    : _announceTermination(std::move(announceTermination)) {
  loop.onSignal(SIGTERM, [this] {
    _announceTermination();
    _terminate();
  });
  loop.onSignal(SIGHUP, [this] { _reload(); });
}

}  // namespace zal
