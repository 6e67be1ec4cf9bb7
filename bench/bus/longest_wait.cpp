#include "bench/bus/longest_wait.h"

#include <algorithm>

#include "bench/bus/session_cost.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

/// Without a barrier for a client that gets no answer.
LongestWait waitIn(lirra::Client& client, double seconds) {
  LongestWait wait;
  for (const Stopwatch whole; whole.seconds() < seconds;) {
    const Stopwatch one;
    if (client.flush(10'000) != LIRRA_OK) return {};
    wait.seconds = std::max(wait.seconds, one.seconds());
    ++wait.barriers;
    pauseMilliseconds(1);
  }
  return wait;
}

}  // namespace

LongestWaits measureLongestWaits(const std::filesystem::path& programs, testing::PrivateBus& bus,
                                 testing::RealModemManager& manager, double seconds) {
  const IdleSession session(programs, bus.address());
  lirra::Client client({.socketPath = session.socketPath(), .sender = "bench"});
  LongestWaits waits;
  manager.hang();
  waits.whileModemDaemonHangs = waitIn(client, seconds);
  manager.goOn();
  bus.kill();
  const LongestWait dead = waitIn(client, seconds / 2);
  bus.start();
  const LongestWait again = waitIn(client, seconds / 2);
  const bool isWhole = dead.barriers > 0 && again.barriers > 0;
  if (isWhole) waits.whileBusIsDead = {std::max(dead.seconds, again.seconds), dead.barriers + again.barriers};
  return waits;
}

}  // namespace zal::bench
