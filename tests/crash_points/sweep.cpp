#include "tests/crash_points/sweep.h"

#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <sstream>
#include <stdexcept>
#include <vector>

namespace zal::testing {
namespace {

/// What a pipe takes in one piece.
constexpr std::size_t kLongestLine = 4000;

/// POINT TAB ERROR TAB CONFIRMED TAB WHETHER A LOSS WAS TOLD TAB CALL TAB VIOLATIONS
std::string lineOf(const TrialPoint& point, const TrialResult& result) {
  std::string line = std::to_string(point.number) + '\t' + std::to_string(point.error) + '\t' +
                     std::to_string(result.confirmed) + '\t' + (result.isLossTold ? "1" : "0") + '\t' +
                     result.call + '\t';
  for (const std::string& violation : result.violations) line += violation + "; ";
  for (char& character : line) character = character == '\n' ? ' ' : character;
  return line.substr(0, kLongestLine) + '\n';
}

/// A process's share of the points.
void work(const SweepOptions& options, unsigned worker, int output) {
  const auto scenario = Scenario::named(options.scenario);
  const std::uint64_t step = options.every * options.jobs;
  for (std::uint64_t number = options.start + worker * options.every;; number += step) {
    std::size_t errors = 1;
    for (std::size_t error = 0; error < errors; ++error) {
      const TrialPoint point{options.harm, number, error, options.of};
      const TrialResult result = tryPoint(*scenario, point, "");
      // A run without harm has to be sound too.
      if (!result.isReached && result.violations.empty()) return;
      if (options.harm == Harm::fault) errors = result.errors;
      const std::string line = lineOf(point, result);
      if (::write(output, line.data(), line.size()) < 0) return;
      if (!result.isReached) return;
    }
  }
}

void take(const std::string& line, SweepFigures& figures) {
  std::istringstream fields(line);
  std::string number, error, confirmed, told, call, violations;
  for (std::string* field : {&number, &error, &confirmed, &told, &call, &violations})
    std::getline(fields, *field, '\t');
  ++figures.points;
  figures.confirmed += std::stoul(confirmed);
  if (told == "1") {
    ++figures.told;
    figures.lastTold = std::max(figures.lastTold, std::stoul(number));
  }
  if (violations.empty()) return;
  ++figures.failures;
  std::printf("  point %s (error %s), %s: %s\n", number.c_str(), error.c_str(), call.c_str(),
              violations.c_str());
}

}  // namespace

SweepFigures sweep(const SweepOptions& options) {
  int pipe[2];
  if (::pipe(pipe) != 0) throw std::runtime_error("no pipe");
  std::vector<pid_t> workers;
  std::fflush(stdout);
  for (unsigned worker = 0; worker < options.jobs; ++worker) {
    const pid_t process = ::fork();
    if (process == 0) {
      ::close(pipe[0]);
      work(options, worker, pipe[1]);
      ::_exit(0);
    }
    workers.push_back(process);
  }
  ::close(pipe[1]);
  SweepFigures figures;
  std::FILE* const results = ::fdopen(pipe[0], "r");
  char* line = nullptr;
  std::size_t space = 0;
  for (ssize_t length = 0; (length = ::getline(&line, &space, results)) > 0;) {
    take(std::string(line, static_cast<std::size_t>(length) - 1), figures);
    std::fflush(stdout);
  }
  std::free(line);
  std::fclose(results);
  for (const pid_t process : workers) {
    int status = 0;
    ::waitpid(process, &status, 0);
    if (status != 0) throw std::runtime_error("a worker failed");
  }
  return figures;
}

}  // namespace zal::testing
