#include "bench/ingest/rounds.h"

#include <cstdio>
#include <memory>

#include "bench/ingest/latency.h"
#include "bench/servers/agent_server.h"
#include "bench/servers/journald_server.h"
#include "bench/servers/rsyslog_server.h"
#include "bench/servers/undecoded_server.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/statistics.h"

namespace zal::bench {
namespace {

constexpr Subject kSubjects[] = {Subject::journald, Subject::agent,   Subject::mirroring,
                                 Subject::rsyslog,  Subject::library, Subject::undecoded};
constexpr unsigned kClientCounts[] = {1, 4};

std::unique_ptr<LogServer> makeServer(Subject subject, const std::filesystem::path& programs) {
  switch (subject) {
    case Subject::journald:
      return std::make_unique<JournaldServer>();
    case Subject::rsyslog:
      return std::make_unique<RsyslogServer>();
    case Subject::undecoded:
      return std::make_unique<UndecodedServer>(programs);
    case Subject::agent:
      return std::make_unique<AgentServer>(programs, AgentClients::oneRecordAWrite);
    case Subject::mirroring:
      return std::make_unique<MirroringAgentServer>(programs);
    case Subject::library:
      return std::make_unique<AgentServer>(programs, AgentClients::library);
  }
  return nullptr;
}

/// Of each round.
struct Latencies {
  std::vector<double> usual;
  std::vector<double> rare;
};

IngestResult resultOf(const std::vector<IngestResult>& runs) {
  const auto of = [&](double IngestResult::*field) {
    std::vector<double> values;
    for (const auto& run : runs) values.push_back(run.*field);
    return values;
  };
  // Speed and cost of the best run: what else happens on the host can only take from it. Memory as usual.
  return {greatest(of(&IngestResult::recordsPerSecond)), least(of(&IngestResult::cpuSecondsPerMillion)),
          median(of(&IngestResult::residentAtRest)), median(of(&IngestResult::residentAfter)),
          median(of(&IngestResult::proportionalAfter))};
}

}  // namespace

const char* subjectName(Subject subject) {
  switch (subject) {
    case Subject::journald:
      return "journald";
    case Subject::rsyslog:
      return "rsyslog";
    case Subject::undecoded:
      return "undecoded";
    case Subject::agent:
      return "agent";
    case Subject::mirroring:
      return "agent, mirroring";
    case Subject::library:
      return "agent, client library";
  }
  return "";
}

RoundResults runRounds(const std::filesystem::path& programs, const Extent& extent) {
  RoundResults results;
  std::map<std::pair<Subject, unsigned>, std::vector<IngestResult>> ingest;
  std::map<Subject, Latencies> latency;
  for (unsigned round = 0; round < extent.rounds; ++round) {
    fprintf(stderr, "round %u of %u\n", round + 1, extent.rounds);
    for (const unsigned clients : kClientCounts) {
      for (const Subject subject : kSubjects) {
        if (results.missing.contains(subject)) continue;
        const ScratchFolder folder;
        IngestResult result;
        const auto server = makeServer(subject, programs);
        std::string missing = measureIngest(*server, folder.path(), clients, extent.records, result);
        if (missing.empty()) {
          ingest[{subject, clients}].push_back(result);
          fprintf(stderr, "  %-21s %u clients %8.0f records/s %6.2f s CPU a million %6.2f MiB\n",
                  subjectName(subject), clients, result.recordsPerSecond, result.cpuSecondsPerMillion,
                  result.residentAfter);
        } else {
          fprintf(stderr, "%s: %s\n", subjectName(subject), missing.c_str());
          results.missing[subject] = missing;
        }
      }
    }
    for (const Subject subject : {Subject::journald, Subject::agent, Subject::rsyslog}) {
      if (results.missing.contains(subject)) continue;
      const ScratchFolder folder;
      const auto server = makeServer(subject, programs);
      std::vector<double> seconds;
      std::string missing = measureLatency(*server, folder.path(), extent.latencyRecords, seconds);
      latency[subject].usual.push_back(percentile(seconds, 0.50));
      latency[subject].rare.push_back(percentile(seconds, 0.99));
      if (!missing.empty()) results.missing[subject] = missing;
    }
  }
  for (const auto& [key, runs] : ingest) results.ingest[key] = resultOf(runs);
  for (const auto& [subject, rounds] : latency) {
    if (!results.missing.contains(subject))
      results.latency[subject] = {least(rounds.usual), least(rounds.rare)};
  }
  return results;
}

}  // namespace zal::bench
