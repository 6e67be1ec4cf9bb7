#include "bench/ingest/session_entries.h"

#include <vector>

#include "bench/ingest/session_agent.h"
#include "bench/support/process_figures.h"
#include "bench/support/statistics.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

struct SessionRun {
  double perSecond = 0, cpuSecondsPerMillion = 0;
  std::string missing;
};

SessionRun runSession(const std::filesystem::path& programs, std::uint64_t entries, bool blackBox) {
  SessionAgent agent(programs, std::string("[blackbox]\nenabled = ") + (blackBox ? "true\n" : "false\n"));
  SessionRun run;
  run.missing = agent.missing();
  if (!run.missing.empty()) return run;
  const double cpu = cpuSeconds(agent.process());
  const Stopwatch watch;
  run.missing = agent.send(entries);
  run.perSecond = static_cast<double>(entries) / watch.seconds();
  run.cpuSecondsPerMillion = (cpuSeconds(agent.process()) - cpu) / static_cast<double>(entries) * 1e6;
  if (run.missing.empty() && blackBox != std::filesystem::exists(agent.folder() / "StateRoot/BlackBox")) {
    run.missing = "the black box is not as it was asked for";
  }
  return run;
}

}  // namespace

SessionEntryFigures measureSessionEntries(const std::filesystem::path& programs, std::uint64_t entries,
                                          unsigned rounds) {
  std::vector<double> rates[2];
  std::vector<double> costs[2];
  for (unsigned round = 0; round < rounds; ++round) {
    for (const bool blackBox : {true, false}) {
      const SessionRun run = runSession(programs, entries, blackBox);
      if (!run.missing.empty()) return {0, 0, 0, 0, run.missing};
      rates[blackBox ? 1 : 0].push_back(run.perSecond);
      costs[blackBox ? 1 : 0].push_back(run.cpuSecondsPerMillion);
    }
  }
  return {median(rates[1]), median(rates[0]), median(costs[1]), median(costs[0]), ""};
}

}  // namespace zal::bench
