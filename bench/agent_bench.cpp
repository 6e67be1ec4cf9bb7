// The agent beside its peers on this machine, in one table. Started by bench/run.
//
//     agent_bench PROGRAM_FOLDER [--quick]

#include <sys/utsname.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <vector>

#include "bench/dump/dump_figures.h"
#include "bench/ingest/idle.h"
#include "bench/ingest/list_figures.h"
#include "bench/ingest/long_session.h"
#include "bench/ingest/rounds.h"
#include "bench/ingest/session_entries.h"
#include "bench/ingest/start_up.h"
#include "bench/servers/agent_server.h"
#include "bench/stackshot/stackshot_figures.h"
#include "bench/support/figure_lines.h"
#include "bench/support/scratch_folder.h"
#include "bench/support/statistics.h"
#include "bench/support/table.h"

namespace zal::bench {
namespace {

using Rows = std::vector<Row>;

std::string mebibytes(double value) { return decimal(value, 2) + " MiB"; }
std::string cpu(double seconds) { return decimal(seconds, 2) + " s"; }

void addIngest(Rows& rows, const RoundResults& results) {
  const auto add = [&](const char* figure, Subject ours, unsigned clients, Subject peer, double target,
                       double IngestResult::*field = &IngestResult::recordsPerSecond) {
    for (const Subject subject : {ours, peer}) {
      if (results.ingest.contains({subject, clients})) continue;
      rows.push_back(skipped(figure, results.missing.at(subject)));
      return;
    }
    const double mine = results.ingest.at({ours, clients}).*field;
    const double theirs = results.ingest.at({peer, clients}).*field;
    if (field == &IngestResult::cpuSecondsPerMillion) {
      rows.push_back(target > 0 ? atMost(figure, mine, theirs, target, cpu)
                                : plain(figure, mine, theirs, cpu));
    } else {
      rows.push_back(target > 0 ? atLeast(figure, mine, theirs, target, rate)
                                : plain(figure, mine, theirs, rate));
    }
  };
  add("ingest, 4 clients, one record a write : journald", Subject::agent, 4, Subject::journald, 8);
  add("ingest, 1 client,  one record a write : journald", Subject::agent, 1, Subject::journald, 0);
  add("ingest, 4 clients, one record a write : rsyslog", Subject::agent, 4, Subject::rsyslog, 3.5);
  add("ingest, 1 client,  one record a write : rsyslog", Subject::agent, 1, Subject::rsyslog, 0);
  add("ingest, 4 clients, one record a write : undecoded", Subject::agent, 4, Subject::undecoded, 0);
  add("ingest, 1 client,  one record a write : undecoded", Subject::agent, 1, Subject::undecoded, 0);
  add("ingest, 4 clients, client library : journald", Subject::library, 4, Subject::journald, 14);
  add("ingest, 1 client,  client library : journald", Subject::library, 1, Subject::journald, 0);
  add("ingest, 4 clients, copies to a journal : none", Subject::mirroring, 4, Subject::agent, 0);
  add("ingest, 1 client,  copies to a journal : none", Subject::mirroring, 1, Subject::agent, 0);
  constexpr auto kCpu = &IngestResult::cpuSecondsPerMillion;
  add("server CPU a million, 4 clients, one a write : journald", Subject::agent, 4, Subject::journald, 0.1,
      kCpu);
  add("server CPU a million, 1 client,  one a write : journald", Subject::agent, 1, Subject::journald, 0,
      kCpu);
  add("server CPU a million, 4 clients, library : journald", Subject::library, 4, Subject::journald, 0, kCpu);
  add("server CPU a million, 4 clients, one a write : rsyslog", Subject::agent, 4, Subject::rsyslog, 0, kCpu);
  add("server CPU a million, 4 clients, one a write : undecoded", Subject::agent, 4, Subject::undecoded, 0,
      kCpu);
}

void addLatency(Rows& rows, const RoundResults& results) {
  const auto add = [&](const char* figure, Subject peer, double std::pair<double, double>::*field,
                       double target) {
    if (!results.latency.contains(Subject::agent) || !results.latency.contains(peer)) {
      rows.push_back(skipped(figure, results.missing.contains(peer) ? results.missing.at(peer) : "no agent"));
      return;
    }
    const double mine = results.latency.at(Subject::agent).*field;
    const double theirs = results.latency.at(peer).*field;
    rows.push_back(target > 0 ? atMost(figure, mine, theirs, target, duration)
                              : plain(figure, mine, theirs, duration));
  };
  using Pair = std::pair<double, double>;
  add("send to line-in-file at 200/s, p50 : journald", Subject::journald, &Pair::first, 0.8);
  add("send to line-in-file at 200/s, p99 : journald", Subject::journald, &Pair::second, 0.9);
  add("send to line-in-file at 200/s, p50 : rsyslog", Subject::rsyslog, &Pair::first, 0);
  add("send to line-in-file at 200/s, p99 : rsyslog", Subject::rsyslog, &Pair::second, 0);
}

Row memoryRow(const char* figure, double mebibytesUsed, double peerUsed, double limit) {
  return {
      figure, mebibytes(mebibytesUsed),      peerUsed > 0 ? mebibytes(peerUsed) : "",
      "",     "at most " + mebibytes(limit), mebibytesUsed > 0 && mebibytesUsed <= limit ? "met" : "MISSED"};
}

void addMemory(Rows& rows, const RoundResults& results) {
  const auto agent = results.ingest.find({Subject::agent, 4});
  if (agent == results.ingest.end()) {
    rows.push_back(skipped("memory of the agent", results.missing.at(Subject::agent)));
    return;
  }
  const auto journald = results.ingest.find({Subject::journald, 4});
  const IngestResult other = journald == results.ingest.end() ? IngestResult{} : journald->second;
  const IngestResult& own = agent->second;
  rows.push_back(
      memoryRow("memory at rest (resident) : journald", own.residentAtRest, other.residentAtRest, 6));
  rows.push_back(
      memoryRow("memory after the records (resident) : journald", own.residentAfter, other.residentAfter, 8));
  rows.push_back({"memory after the records (proportional) : journald", mebibytes(own.proportionalAfter),
                  mebibytes(other.proportionalAfter), "", "", ""});
}

/// Returned: whether the agent did its part.
bool addStartUp(Rows& rows, const std::filesystem::path& programs, unsigned runs) {
  fprintf(stderr, "starting each daemon %u times\n", runs);
  const ScratchFolder folder;
  const ChildProcess::Options agent = AgentServer::options(programs, folder.path(), 1U << 30U);
  ChildProcess::Options bare;
  const auto bareSocket = folder.path() / "bare.sock";
  bare.command = {(programs / "bare_daemon").string(), bareSocket.string(),
                  (folder.path() / "bare.log").string()};
  std::vector<double> ours;
  std::vector<double> theirs;
  if (!std::filesystem::exists(bare.command.front())) runs = 1;
  for (unsigned run = 0; run < runs; ++run) {
    ours.push_back(measureStartUp(agent, AgentServer::socketIn(folder.path())));
    theirs.push_back(measureStartUp(bare, bareSocket));
  }
  constexpr const char* kFigure = "exec to listening socket : bare Asio + spdlog daemon";
  if (percentile(ours, 0) < 0 || percentile(theirs, 0) < 0) {
    const bool missing = !std::filesystem::exists(bare.command.front());
    rows.push_back(skipped(kFigure, missing ? "built without spdlog" : "a daemon did not listen"));
  } else {
    rows.push_back(atMost(kFigure, median(ours), median(theirs), 1.5, duration));
  }
  return percentile(ours, 0) >= 0;
}

/// Returned: whether there was anything to add.
bool addLists(Rows& rows, std::map<std::string, double> figures) {
  if (figures.empty()) {
    rows.push_back(skipped("sorted insertion, session end", "list_bench failed"));
    return false;
  }
  for (const char* order : {"ascending", "descending", "random", "zigzag", "equal"}) {
    rows.push_back(plain(std::string("timed entries, ") + order + " : multimap", figures[order],
                         figures[std::string("multimap_") + order], duration));
  }
  rows.push_back(atMost("timed entries, worst order : multimap's worst", figures["worst"],
                        figures["multimap_worst"], 0.25, duration));
  rows.push_back(atMost("timed entries, worst order : own ascending", figures["worst"], figures["ascending"],
                        3, duration));
  rows.push_back(atMost("ending a session of verbose lines, ascending : plain write",
                        figures["session_end_ascending"], figures["plain_write_ascending"], 2, duration));
  rows.push_back(plain("ending a session of verbose lines, random : plain write",
                       figures["session_end_random"], figures["plain_write_random"], duration));
  return true;
}

/// Returned: whether there was a dump.
bool addDump(Rows& rows, const std::filesystem::path& programs, bool quick) {
  constexpr double kClosingDelay = 8;
  constexpr double kLongestHold = 0.020;
  fprintf(stderr, "a dump, and a client who has nothing to do with it\n");
  const DumpFigures figures = measureDump(programs, quick ? 0.1 : 0);
  if (!figures.missing.empty()) {
    rows.push_back(skipped("a dump's cost", figures.missing));
    return false;
  }
  rows.push_back({"another client's barrier, usual", duration(figures.usualAnswer), "", "", "", ""});
  rows.push_back({"another client's barrier, longest during a dump", duration(figures.longestAnswer), "", "",
                  "20 ms", figures.longestAnswer <= kLongestHold ? "met" : "MISSED"});
  rows.push_back({"dump: request to reply, beyond its own 8 s",
                  duration(figures.requestToReply - (quick ? 0 : kClosingDelay)), "", "", "", ""});
  return true;
}

/// Returned: whether there was a session.
bool addSessionEntries(Rows& rows, const std::filesystem::path& programs, const Extent& extent) {
  constexpr const char* kFigure = "session entries, 1 client, library : without the black box";
  fprintf(stderr, "entries of a session, with and without the black box\n");
  const SessionEntryFigures figures = measureSessionEntries(programs, extent.records, extent.rounds);
  if (!figures.missing.empty()) {
    rows.push_back(skipped(kFigure, figures.missing));
    return false;
  }
  rows.push_back(atLeast(kFigure, figures.perSecond, figures.perSecondWithout, 0.85, rate));
  rows.push_back(plain("agent's CPU a million entries : without the black box", figures.cpuSecondsPerMillion,
                       figures.cpuSecondsPerMillionWithout, cpu));
  return true;
}

constexpr double kMostMemory = 300e6 / (1 << 20);

/// Returned: whether the session was written as it should be, or a good reason that there was none.
bool addLongSession(Rows& rows, const std::filesystem::path& programs, std::uint64_t entries) {
  constexpr double kLongestHold = 0.050;
  fprintf(stderr, "a session of %llu lines\n", static_cast<unsigned long long>(entries));
  const std::string lines = " of a session of " + std::to_string(entries) + " lines";
  const LongSessionFigures figures = measureLongSession(programs, entries);
  if (!figures.missing.empty()) {
    rows.push_back(skipped("memory" + lines, figures.missing));
    return figures.peakMebibytes == 0;
  }
  rows.push_back({"memory" + lines + " (most resident)", mebibytes(figures.peakMebibytes), "", "", "300 MB",
                  figures.peakMebibytes <= kMostMemory ? "met" : "MISSED"});
  rows.push_back({"entries" + lines, rate(figures.perSecond), "", "", "", ""});
  rows.push_back({"end" + lines + ", 3 s of delay included", duration(figures.secondsToEnd), "", "", "", ""});
  rows.push_back({"another client's barrier, longest meanwhile", duration(figures.longestAnswer), "", "",
                  "50 ms", figures.longestAnswer <= kLongestHold ? "met" : "MISSED"});
  return true;
}

/// Returned: as above.
bool addRecoveredSession(Rows& rows, const std::filesystem::path& programs, std::uint64_t entries) {
  fprintf(stderr, "a session of %llu lines that is recovered\n", static_cast<unsigned long long>(entries));
  const std::string lines = " a session of " + std::to_string(entries) + " lines";
  const RecoveredSessionFigures figures = measureRecoveredSession(programs, entries);
  if (!figures.missing.empty()) {
    rows.push_back(skipped("memory of recovering" + lines, figures.missing));
    return figures.peakMebibytes == 0;
  }
  rows.push_back({"memory of recovering" + lines + " (most resident)", mebibytes(figures.peakMebibytes), "",
                  "", "300 MB", figures.peakMebibytes <= kMostMemory ? "met" : "MISSED"});
  rows.push_back({"start of the agent that recovers it", duration(figures.seconds), "", "", "", ""});
  return true;
}

/// Returned: whether there was a stackshot.
bool addStackshot(Rows& rows, const std::filesystem::path& programs, bool quick) {
  const unsigned processes = quick ? 3 : 40;
  constexpr unsigned kThreadsEach = 4;
  const std::string figure =
      "stackshot, " + std::to_string(processes * kThreadsEach) + " threads : eu-stack in a loop";
  fprintf(stderr, "stackshots of %u processes\n", processes);
  const StackshotFigures figures = measureStackshot(programs, processes, kThreadsEach, quick ? 1 : 11);
  if (!figures.missing.empty()) {
    rows.push_back(skipped(figure, figures.missing));
    return false;
  }
  rows.push_back(plain(figure, figures.ours, figures.peer, duration));
  if (!figures.peerMissing.empty()) rows.back().peer = figures.peerMissing;
  return true;
}

/// Returned: whether there was something to measure, or a good reason that there was not.
bool addBus(Rows& rows, const std::filesystem::path& programs, bool quick) {
  const unsigned seconds = quick ? 6 : 60;  // at least one sample
  fprintf(stderr, "a modem's state, and a session of %u s that is sampled\n", seconds);
  FigureLines lines = figureLinesOf(
      {(programs / "bus_bench").string(), programs.string(), quick ? "2" : "41", std::to_string(seconds)});
  auto& figures = lines.figures;
  if (figures.empty()) {
    rows.push_back(
        skipped("modem and Wi-Fi on a bus", lines.reason.empty() ? "bus_bench failed" : lines.reason));
    return !lines.reason.empty();
  }
  rows.push_back(
      plain("snapshot of the modem : mmcli -m any -J", figures["snapshot"], figures["mmcli"], duration));
  rows.push_back(plain("CPU of a session in an hour, only sampled : without a bus",
                       figures["bus_cpu_an_hour"], figures["no_bus_cpu_an_hour"], duration));
  rows.push_back(plain("memory at rest beside a bus (resident) : without one", figures["bus_at_rest"],
                       figures["no_bus_at_rest"], mebibytes));
  rows.push_back(plain("memory in a sampled session (resident) : without a bus", figures["bus_in_session"],
                       figures["no_bus_in_session"], mebibytes));
  constexpr double kLongestWait = 0.100;
  const auto addWait = [&](const char* figure, const std::string& name) {
    const bool isMet = figures[name + "_barriers"] > 0 && figures[name] <= kLongestWait;
    rows.push_back({figure, duration(figures[name]), "", "", "100 ms", isMet ? "met" : "MISSED"});
  };
  addWait("longest barrier while the modem daemon hangs", "wait_hung");
  addWait("longest barrier while the bus dies and comes back", "wait_dead");
  return figures["snapshot"] > 0;
}

int run(const std::filesystem::path& programs, bool quick) {
  Extent extent;
  if (quick) extent = {1, 5'000, 50, 3, 2, 20'000};
  utsname host{};
  uname(&host);
  Rows rows;
  RoundResults results = runRounds(programs, extent);
  addIngest(rows, results);
  addLatency(rows, results);
  addMemory(rows, results);
  bool ownPart = addStartUp(rows, programs, extent.startUps);
  ownPart = addSessionEntries(rows, programs, extent) && ownPart;
  ownPart = addLongSession(rows, programs, quick ? 20'000 : 10'000'000) && ownPart;
  ownPart = addRecoveredSession(rows, programs, quick ? 20'000 : 2'000'000) && ownPart;
  ownPart = addDump(rows, programs, quick) && ownPart;
  ownPart = addStackshot(rows, programs, quick) && ownPart;
  ownPart = addBus(rows, programs, quick) && ownPart;
  {
    // The idle agent idles on while the lists are measured: its own switches are counted, nobody else's.
    IdleWatch idle(programs);
    fprintf(stderr, "lists and session ends of %llu entries; an agent left alone for %u s\n",
            static_cast<unsigned long long>(extent.entries), extent.idleSeconds);
    ownPart = addLists(rows, runListBench(programs, extent.entries, extent.rounds)) && ownPart;
    ownPart = ownPart && idle.missing().empty();
    if (idle.missing().empty()) {
      const auto switches = idle.switchesAfter(extent.idleSeconds);
      rows.push_back({"wake-ups in " + std::to_string(extent.idleSeconds) + " idle seconds",
                      std::to_string(switches), "", "", "0", switches == 0 ? "met" : "MISSED"});
    } else {
      rows.push_back(skipped("wake-ups when idle", idle.missing()));
    }
  }
  printf("\n%s %s, %ld processors, files in %s, %llu records of 120 bytes a run, %u rounds\n\n", host.sysname,
         host.release, sysconf(_SC_NPROCESSORS_ONLN), ScratchFolder::parent().c_str(),
         static_cast<unsigned long long>(extent.records), extent.rounds);
  if (quick) {
    for (Row& row : rows) row.target = row.verdict = "";
    printf("A quick run: it shows that the benchmarks work, its figures mean nothing.\n\n");
  }
  printTable(rows);
  for (const Subject own : {Subject::agent, Subject::library, Subject::undecoded}) {
    ownPart = ownPart && !results.missing.contains(own);
  }
  return ownPart ? 0 : 1;
}

}  // namespace
}  // namespace zal::bench

int main(int count, char** arguments) {
  const bool quick = count == 3 && strcmp(arguments[2], "--quick") == 0;
  if (count < 2 || (count == 3 && !quick) || count > 3) {
    fprintf(stderr, "usage: agent_bench PROGRAM_FOLDER [--quick]\n");
    return 2;
  }
  return zal::bench::run(arguments[1], quick);
}
