#include "bench/ingest/long_session.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <functional>

#include "bench/ingest/session_agent.h"
#include "bench/servers/agent_server.h"
#include "bench/servers/record_text.h"
#include "bench/support/process_figures.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

namespace fs = std::filesystem;

// What the record, the lines on the disk and the log files take, with something to spare.
constexpr std::uintmax_t kRoomForEntry = 800;
constexpr double kLongestEnd = 600;

/// The delayed end is due, and what it sets going is over.
bool isWritten(const SessionAgent& agent) {
  std::error_code error;
  return fs::is_empty(agent.folder() / "StateRoot/BlackBox", error) && !error;
}

/// Another client, who notices how long the agent's main thread is busy with something else.
double longestAnswerUntil(const SessionAgent& agent, const std::function<bool()>& isOver) {
  const std::string path = AgentServer::socketIn(agent.folder()).string();
  lirra_options options;
  lirra_options_init(&options);
  options.socket_path = path.c_str();
  lirra_handle* const client = lirra_open(&options);
  double longest = 0;
  const Stopwatch all;
  while (!isOver() && all.seconds() < kLongestEnd) {
    const Stopwatch answer;
    if (lirra_flush(client, 60'000) == LIRRA_OK) longest = std::max(longest, answer.seconds());
    pauseMilliseconds(1);
  }
  lirra_close(client, 0);
  return longest;
}

fs::path verboseLogIn(const fs::path& folder) {
  for (const auto& entry : fs::recursive_directory_iterator(folder)) {
    if (entry.path().filename().string().rfind("Verbose Log", 0) == 0) return entry.path();
  }
  return {};
}

/// Whether every number is there once, in order.
bool isWhole(const fs::path& log, std::uint64_t entries) {
  std::ifstream lines(log);
  std::uint64_t next = 0;
  for (std::string line; std::getline(lines, line);) {
    const std::size_t mark = line.find("record ");
    if (mark == std::string::npos) continue;
    if (std::strtoull(line.c_str() + mark + 7, nullptr, 10) != next++) return false;
  }
  return next == entries;
}

bool hasRoomFor(std::uint64_t entries) {
  return fs::space(ScratchFolder::parent()).available >= entries * kRoomForEntry;
}

constexpr const char* kNoRoom = "not enough room for its files";
constexpr const char* kNotWhole = "the session's verbose log is not whole";

}  // namespace

LongSessionFigures measureLongSession(const fs::path& programs, std::uint64_t entries) {
  LongSessionFigures figures;
  if (!hasRoomFor(entries)) {
    figures.missing = kNoRoom;
    return figures;
  }
  SessionAgent agent(programs, "");
  figures.missing = agent.missing();
  if (!figures.missing.empty()) return figures;
  const Stopwatch sending;
  figures.missing = agent.send(entries);
  figures.perSecond = static_cast<double>(entries) / sending.seconds();
  if (!figures.missing.empty()) return figures;
  const Stopwatch ending;
  agent.endSession();
  figures.longestAnswer = longestAnswerUntil(agent, [&agent] { return isWritten(agent); });
  figures.secondsToEnd = ending.seconds();
  figures.peakMebibytes = peakMebibytes(agent.process());
  if (!isWritten(agent) || !isWhole(verboseLogIn(agent.folder()), entries)) {
    figures.missing = kNotWhole;
  }
  return figures;
}

RecoveredSessionFigures measureRecoveredSession(const fs::path& programs, std::uint64_t entries) {
  RecoveredSessionFigures figures;
  if (!hasRoomFor(entries)) {
    figures.missing = kNoRoom;
    return figures;
  }
  SessionAgent agent(programs, "");
  figures.missing = agent.missing();
  if (figures.missing.empty()) figures.missing = agent.send(entries);
  if (!figures.missing.empty()) return figures;
  const Stopwatch recovering;
  figures.missing = agent.cutOff();
  figures.seconds = recovering.seconds();
  figures.peakMebibytes = peakMebibytes(agent.process());
  if (figures.missing.empty() && (!isWritten(agent) || !isWhole(verboseLogIn(agent.folder()), entries))) {
    figures.missing = kNotWhole;
  }
  return figures;
}

}  // namespace zal::bench
