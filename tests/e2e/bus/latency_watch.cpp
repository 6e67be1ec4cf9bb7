#include "tests/e2e/bus/latency_watch.h"

#include <algorithm>

#include "tests/e2e/raw_client.h"

namespace zal::testing {
namespace {

using Clock = std::chrono::steady_clock;

}  // namespace

LatencyWatch::LatencyWatch(const std::string& socketPath)
    : _asked(Clock::now()), _thread([this, socketPath] { _watch(socketPath); }) {}

LatencyWatch::~LatencyWatch() {
  _stop = true;
  _thread.join();
}

void LatencyWatch::_watch(const std::string& socketPath) {
  RawClient client(socketPath);
  while (!_stop) {
    _asked = Clock::now();
    if (!client.barrier()) return;
    const auto wait = (Clock::now() - _asked.load()).count();
    if (wait > _longest) _longest = wait;
    ++_answers;
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
}

std::chrono::milliseconds LatencyWatch::takeLongest() {
  const Clock::duration ended(_longest.exchange(0));
  // A pause between two barriers counts as an open one: it is two milliseconds.
  return std::chrono::duration_cast<std::chrono::milliseconds>(std::max(ended, Clock::now() - _asked.load()));
}

}  // namespace zal::testing
