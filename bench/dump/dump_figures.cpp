#include "bench/dump/dump_figures.h"

#include <algorithm>
#include <fstream>
#include <vector>

#include "bench/servers/agent_server.h"
#include "bench/servers/unix_socket.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/statistics.h"
#include "bench/support/timing.h"
#include "client/lirra.hpp"

namespace zal::bench {
namespace {

constexpr std::int64_t kDumpAction = 14;
constexpr std::int64_t kNoQuestions = 4;  // neither prompt nor alert
constexpr std::int64_t kUsualFlags = 0x5F;
constexpr double kReplyLimit = 60;
constexpr int kQuietBarriers = 2000;

double secondsOfBarrier(lirra::Client& client) {
  const Stopwatch watch;
  return client.flush(10'000) == LIRRA_OK ? watch.seconds() : -1;
}

/// Barriers until the reply is there.
bool takeDump(lirra::Client& asking, lirra::Client& other, DumpFigures& figures) {
  lirra::Dictionary info;
  info.setInt64("collectionFlags", kUsualFlags).setInt64("displayFlags", kNoQuestions);
  std::uint64_t ticket = 0;
  const Stopwatch watch;
  if (asking.ask("Vistel", kDumpAction, info, ticket) != LIRRA_OK) return false;
  while (watch.seconds() < kReplyLimit) {
    const double seconds = secondsOfBarrier(other);
    if (seconds < 0) return false;
    figures.longestAnswer = std::max(figures.longestAnswer, seconds);
    lirra::Dictionary reply;
    const lirra::Result result = asking.awaitReply(ticket, 0, reply);
    if (result == LIRRA_OK) {
      figures.requestToReply = watch.seconds();
      return true;
    }
    if (result != LIRRA_TIMEOUT) return false;
  }
  return false;
}

}  // namespace

DumpFigures measureDump(const std::filesystem::path& programs, double closingDelay) {
  DumpFigures figures;
  const ScratchFolder folder;
  const ChildProcess::Options options = AgentServer::options(programs, folder.path(), 1U << 30U);
  {
    std::ofstream settings(folder.path() / "lirra.toml", std::ios::app);
    // Nobody's log reader but the benchmark's own is to be killed.
    settings << "[commands]\nsystemLogReader = \"benchreader\"\n";
    if (closingDelay > 0) settings << "[testing]\nclosingStageDelay = " << closingDelay << "\n";
  }
  ChildProcess agent(options);
  const std::string socket = AgentServer::socketIn(folder.path()).string();
  if (!waitUntil(10, [&] { return UnixSocket(UnixSocket::Kind::stream, socket).connected(); })) {
    figures.missing = "the agent does not start";
    return figures;
  }
  lirra::Client asking({.socketPath = socket, .sender = "asking"});
  lirra::Client other({.socketPath = socket, .sender = "other"});
  std::vector<double> quiet;
  for (int number = 0; number < kQuietBarriers; ++number) quiet.push_back(secondsOfBarrier(other));
  figures.usualAnswer = median(quiet);
  if (!takeDump(asking, other, figures)) figures.missing = "the dump got no reply";
  return figures;
}

}  // namespace zal::bench
