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

IngestResult medians(const std::vector<IngestResult>& runs) {
  const auto of = [&](double IngestResult::*field) {
    std::vector<double> values;
    for (const auto& run : runs) values.push_back(run.*field);
    return median(values);
  };
  return {of(&IngestResult::recordsPerSecond), of(&IngestResult::cpuSecondsPerMillion),
          of(&IngestResult::residentAtRest), of(&IngestResult::residentAfter),
          of(&IngestResult::proportionalAfter)};
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
  std::map<Subject, std::vector<double>> latency;
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
      std::string missing = measureLatency(*server, folder.path(), extent.latencyRecords, latency[subject]);
      if (!missing.empty()) results.missing[subject] = missing;
    }
  }
  for (const auto& [key, runs] : ingest) results.ingest[key] = medians(runs);
  for (const auto& [subject, seconds] : latency) {
    results.latency[subject] = {percentile(seconds, 0.50), percentile(seconds, 0.99)};
  }
  return results;
}

}  // namespace zal::bench
