#include "bench/ingest/latency.h"

#include <sched.h>

#include <memory>

#include "bench/support/timing.h"

namespace zal::bench {
namespace {

constexpr long kDistanceMicroseconds = 5000;  // 200 records a second: every record finds its server asleep
constexpr double kPatienceForOneSeconds = 5;

}  // namespace

std::string measureLatency(LogServer& server, const std::filesystem::path& folder, unsigned records,
                           std::vector<double>& seconds) {
  if (std::string missing = server.start(folder); !missing.empty()) return missing;
  if (!server.warmUp()) return std::string(server.name()) + " stores nothing";
  const std::unique_ptr<RecordSender> sender = server.connect(0);
  std::uint64_t expected = server.stored();
  for (unsigned number = 1; number <= records; ++number) {
    pauseMicroseconds(kDistanceMicroseconds);
    ++expected;
    const Stopwatch watch;
    sender->send(number);
    while (server.stored() < expected) {
      sched_yield();  // or a server that was woken on this processor would wait for our time slice to end
      if (watch.seconds() > kPatienceForOneSeconds) return std::string(server.name()) + " lost a record";
    }
    seconds.push_back(watch.seconds());
  }
  server.stop();
  return {};
}

}  // namespace zal::bench
