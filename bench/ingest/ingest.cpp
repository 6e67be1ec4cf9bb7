#include "bench/ingest/ingest.h"

#include <atomic>
#include <memory>
#include <thread>
#include <vector>

#include "bench/support/process_figures.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

constexpr double kPatienceSeconds = 60;

void sendAll(RecordSender& sender, std::uint64_t count, const std::atomic<bool>& go) {
  while (!go.load(std::memory_order_acquire)) pauseMicroseconds(50);
  for (std::uint64_t number = 1; number <= count; ++number) sender.send(number);
  sender.finish();
}

}  // namespace

std::string measureIngest(LogServer& server, const std::filesystem::path& folder, unsigned clients,
                          std::uint64_t records, IngestResult& result) {
  if (std::string missing = server.start(folder); !missing.empty()) return missing;
  result.residentAtRest = residentMebibytes(server.processId());
  if (!server.warmUp()) return std::string(server.name()) + " stores nothing";
  std::vector<std::unique_ptr<RecordSender>> senders;
  for (unsigned client = 0; client < clients; ++client) senders.push_back(server.connect(client));
  const std::uint64_t each = records / clients;
  const std::uint64_t expected = server.stored() + each * clients;

  std::atomic<bool> go{false};
  std::vector<std::thread> threads;
  for (auto& sender : senders) threads.emplace_back([&] { sendAll(*sender, each, go); });
  pauseMilliseconds(20);
  const double cpuBefore = cpuSeconds(server.processId());
  const Stopwatch watch;
  go.store(true, std::memory_order_release);
  const bool complete = waitUntil(kPatienceSeconds, [&] { return server.stored() >= expected; });
  const double seconds = watch.seconds();
  for (auto& thread : threads) thread.join();
  const auto sent = static_cast<double>(each * clients);
  result.recordsPerSecond = sent / seconds;
  result.cpuSecondsPerMillion = (cpuSeconds(server.processId()) - cpuBefore) / sent * 1e6;
  result.residentAfter = residentMebibytes(server.processId());
  result.proportionalAfter = proportionalMebibytes(server.processId());
  const std::uint64_t read = server.storedByReading();
  senders.clear();
  server.stop();
  if (!complete || read != expected) {
    return std::string(server.name()) + " stored " + std::to_string(read) + " of " +
           std::to_string(expected) + " records";
  }
  return {};
}

}  // namespace zal::bench
