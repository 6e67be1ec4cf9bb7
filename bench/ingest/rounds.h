#pragma once

#include <cstdint>
#include <filesystem>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "bench/ingest/ingest.h"

namespace zal::bench {

/// How much of everything.
struct Extent {
  unsigned rounds = 5;              ///< every server once a round, one after the other
  std::uint64_t records = 200'000;  ///< an ingest run
  unsigned latencyRecords = 400;    ///< a latency run, 200 a second
  unsigned startUps = 41;           ///< of each daemon
  unsigned idleSeconds = 60;
  std::uint64_t entries = 1'000'000;  ///< of lists and sessions
};

enum class Subject { journald, rsyslog, undecoded, agent, mirroring, library };
[[nodiscard]] const char* subjectName(Subject subject);

/// Of all rounds the best speed, cost and latencies and the median of the memory; and why a subject has none.
struct RoundResults {
  std::map<std::pair<Subject, unsigned>, IngestResult> ingest;  ///< by subject and number of clients
  std::map<Subject, std::pair<double, double>> latency;         ///< p50 and p99 in seconds
  std::map<Subject, std::string> missing;
};

/// Runs all rounds, saying on standard error which one it is at.
[[nodiscard]] RoundResults runRounds(const std::filesystem::path& programs, const Extent& extent);

}  // namespace zal::bench
