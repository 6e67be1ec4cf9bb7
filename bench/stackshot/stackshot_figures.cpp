#include "bench/stackshot/stackshot_figures.h"

#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/types.h>
#include <unistd.h>

#include <csignal>
#include <thread>
#include <vector>

#include "bench/archive/measured_run.h"
#include "bench/support/child_process.h"
#include "bench/support/fresh_process.h"
#include "bench/support/statistics.h"
#include "bench/support/timing.h"

namespace zal::bench {
namespace {

constexpr int kDepth = 10;

const volatile bool forEver = true;  // the compiler is not to know

[[gnu::noinline]] int sleepAtDepth(int depth) {
  if (depth > 0) return sleepAtDepth(depth - 1) + 1;
  while (forEver) pause();
  return 0;
}

void startSleeper(unsigned threads, int readyPipe, std::vector<pid_t>& sleepers) {
  const pid_t id = fork();
  if (id > 0) sleepers.push_back(id);
  if (id != 0) return;
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  for (unsigned thread = 1; thread < threads; ++thread) std::thread([] { sleepAtDepth(kDepth); }).detach();
  if (write(readyPipe, "!", 1) != 1) _exit(1);
  _exit(sleepAtDepth(kDepth));
}

std::vector<pid_t> startSleepers(unsigned processes, unsigned threadsEach) {
  std::vector<pid_t> sleepers;
  int ready[2] = {-1, -1};
  if (pipe(ready) != 0) return sleepers;
  for (unsigned process = 0; process < processes; ++process) startSleeper(threadsEach, ready[1], sleepers);
  close(ready[1]);
  char mark = 0;
  for (std::size_t count = 0; count < sleepers.size() && read(ready[0], &mark, 1) == 1; ++count) {
  }
  close(ready[0]);
  pauseMilliseconds(50);  // the last threads fall asleep
  return sleepers;
}

std::vector<std::string> peerCommand(const std::string& program, const std::vector<pid_t>& sleepers) {
  std::string line = "for id in";
  for (const pid_t id : sleepers) line += " " + std::to_string(id);
  return {"/bin/sh", "-c", line + "; do " + program + " -p $id || exit; done"};
}

/// In a process that is the first one of its process ids. Returned: our median, the peer's or 0; nothing
/// when ours does not work.
std::vector<double> measureAlone(const std::string& program, const std::string& peer, unsigned processes,
                                 unsigned threadsEach, unsigned rounds) {
  if (mount("proc", "/proc", "proc", 0, nullptr) != 0) return {};
  const std::vector<pid_t> sleepers = startSleepers(processes, threadsEach);
  std::vector<double> ours;
  std::vector<double> theirs;
  for (unsigned round = 0; round < rounds; ++round) {
    const RunFigures own = measureRun({program, "--output", "-"}, "/");
    if (!own.succeeded) return {};
    ours.push_back(own.seconds);
    if (peer.empty()) continue;
    const RunFigures other = measureRun(peerCommand(peer, sleepers), "/");
    if (other.succeeded) theirs.push_back(other.seconds);
  }
  return {median(ours), theirs.size() == rounds ? median(theirs) : 0};
}

}  // namespace

StackshotFigures measureStackshot(const std::filesystem::path& programs, unsigned processes,
                                  unsigned threadsEach, unsigned rounds) {
  const std::string program = programs / "lirra-stackshot";
  const std::string peer = findProgram("eu-stack");
  const auto figures = inFreshProcess([&]() -> std::vector<double> {
    if (enterPrivateHost() != nullptr || unshare(CLONE_NEWPID) != 0) return {};
    return inFreshProcess([&] { return measureAlone(program, peer, processes, threadsEach, rounds); });
  });
  StackshotFigures result;
  if (figures.size() != 2) {
    result.missing = "no process ids of its own, or it failed";
    return result;
  }
  result.ours = figures[0];
  result.peer = figures[1];
  if (peer.empty()) {
    result.peerMissing = "eu-stack is not installed";
  } else if (figures[1] <= 0) {
    result.peerMissing = "eu-stack failed";
  }
  return result;
}

}  // namespace zal::bench
