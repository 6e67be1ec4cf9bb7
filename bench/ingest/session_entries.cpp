#include "bench/ingest/session_entries.h"

#include <fstream>
#include <vector>

#include "bench/servers/agent_server.h"
#include "bench/servers/record_text.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/process_figures.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/statistics.h"
#include "bench/support/timing.h"
#include "client/lirra.h"

namespace zal::bench {
namespace {

constexpr const char* kSession = "Bench";
constexpr unsigned kEntriesBetweenLooks = 1024;
constexpr std::uint64_t kFullSendQueue = 3U << 20U;

struct SessionRun {
  double perSecond = 0, cpuSecondsPerMillion = 0;
  std::string missing;
};

void waitForRoom(lirra_handle* client) {
  lirra_statistics statistics;
  statistics.size = sizeof statistics;
  while (lirra_status(client, &statistics) == LIRRA_OK && statistics.queued_bytes > kFullSendQueue) {
    pauseMicroseconds(200);
  }
}

/// Returned: what went wrong, or nothing.
std::string sendEntries(lirra_handle* client, std::uint64_t entries) {
  std::string text = RecordText(0).text();
  const std::size_t position = numberPosition(text);
  for (std::uint64_t number = 0; number < entries; ++number) {
    if (number % kEntriesBetweenLooks == 0) waitForRoom(client);
    putNumber(text, position, number);
    const double time = 1.7e9 + 0.001 * static_cast<double>(number);
    if (lirra_describe(client, kSession, "Transport", text.c_str(), time) != LIRRA_OK)
      return "an entry was refused";
  }
  return lirra_flush(client, 60'000) == LIRRA_OK ? "" : "the barrier was not answered";
}

SessionRun runSession(const std::filesystem::path& programs, std::uint64_t entries, bool blackBox) {
  const ScratchFolder folder;
  const ChildProcess::Options options = AgentServer::options(programs, folder.path(), 1U << 30U);
  std::ofstream(folder.path() / "lirra.toml", std::ios::app)
      << "[blackbox]\nenabled = " << (blackBox ? "true" : "false") << "\n";
  std::ofstream(folder.path() / "com.vendel.logging.toml") << "CallLogging = true\n";
  ChildProcess agent(options);
  const auto socket = AgentServer::socketIn(folder.path());
  const auto listens = [&] { return UnixSocket(UnixSocket::Kind::stream, socket).connected(); };
  if (!waitUntil(10, listens)) return {0, 0, "the agent does not start"};

  const std::string path = socket.string();
  lirra_options client;
  lirra_options_init(&client);
  client.socket_path = path.c_str();
  client.sender = "callservice";
  lirra_handle* const handle = lirra_open(&client);
  lirra_begin_session(handle, kSession, 0, 0);
  SessionRun run;
  run.missing = lirra_flush(handle, 10'000) == LIRRA_OK ? "" : "the session did not begin";
  if (run.missing.empty()) {
    const double cpu = cpuSeconds(agent.id());
    const Stopwatch watch;
    run.missing = sendEntries(handle, entries);
    run.perSecond = static_cast<double>(entries) / watch.seconds();
    run.cpuSecondsPerMillion = (cpuSeconds(agent.id()) - cpu) / static_cast<double>(entries) * 1e6;
    if (run.missing.empty() && blackBox != std::filesystem::exists(folder.path() / "StateRoot/BlackBox")) {
      run.missing = "the black box is not as it was asked for";
    }
  }
  lirra_close(handle, 0);
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
