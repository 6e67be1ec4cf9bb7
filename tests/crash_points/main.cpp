#include <cstdio>
#include <cstdlib>
#include <ctime>

#include <exception>
#include <map>
#include <string>

#include "tests/crash_points/supervised_agent.h"
#include "tests/crash_points/sweep.h"

namespace {

using namespace zal::testing;

constexpr const char* kUsage =
    "crash_points [call|dump] [kill|tear|fault|disk|full] [--every N] [--start N] [--jobs N]\n"
    "             [--of SYSTEMCALL] [--only NUMBER [--error N] [--keep DIRECTORY]]\n";

constexpr int kSkipped = 77;

const std::map<std::string, Harm> kHarms = {{"kill", Harm::kill},
                                            {"tear", Harm::tear},
                                            {"fault", Harm::fault},
                                            {"disk", Harm::disk},
                                            {"full", Harm::full}};

int tryOne(const SweepOptions& options, std::uint64_t number, std::size_t error, const std::string& keepIn) {
  const TrialResult result =
      tryPoint(*Scenario::named(options.scenario), {options.harm, number, error, options.of}, keepIn);
  std::printf("point %llu: %s; %s; %zu confirmed\n", static_cast<unsigned long long>(number),
              result.isReached ? result.call.c_str() : "no such call", result.outcome.c_str(),
              result.confirmed);
  for (const std::string& violation : result.violations) std::printf("  %s\n", violation.c_str());
  return result.violations.empty() ? 0 : 1;
}

int run(int argc, char** argv) {
  SweepOptions options;
  std::uint64_t only = 0;
  std::size_t error = 0;
  std::string keepIn;
  for (int i = 1; i < argc; ++i) {
    const std::string word = argv[i];
    const auto value = [&]() -> std::string { return i + 1 < argc ? argv[++i] : ""; };
    if (kHarms.contains(word)) {
      options.harm = kHarms.at(word);
    } else if (Scenario::named(word) != nullptr) {
      options.scenario = word;
    } else if (word == "--every") {
      options.every = std::stoul(value());
    } else if (word == "--start") {
      options.start = std::stoul(value());
    } else if (word == "--jobs") {
      options.jobs = static_cast<unsigned>(std::stoul(value()));
    } else if (word == "--of") {
      options.of = value();
    } else if (word == "--only") {
      only = std::stoul(value());
    } else if (word == "--error") {
      error = std::stoul(value());
    } else if (word == "--keep") {
      keepIn = value();
    } else {
      std::fputs(kUsage, stderr);
      return 2;
    }
  }
  if (!SupervisedAgent::isPossible()) {
    std::puts("skipped: this host lets nobody ask about another process's system calls");
    return kSkipped;
  }
  if (only > 0) return tryOne(options, only, error, keepIn);
  if (options.start == 0) {
    options.start = 1 + static_cast<std::uint64_t>(std::time(nullptr)) % options.every;
    if (options.every > 1) {
      std::printf("every %lluth point from %llu\n", static_cast<unsigned long long>(options.every),
                  static_cast<unsigned long long>(options.start));
    }
  }
  const SweepFigures figures = sweep(options);
  std::printf("%s: %zu points, %zu confirmed by barriers, %zu points with something lost or left\n",
              options.scenario.c_str(), figures.points, figures.confirmed, figures.failures);
  if (figures.told > 0) {
    std::printf("  of them %zu where something found no room, which the log says; the last is %llu\n",
                figures.told, static_cast<unsigned long long>(figures.lastTold));
  }
  return figures.failures == 0 && figures.points > 0 ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
  // In memory, where there is such a place: nothing here depends on the medium.
  ::setenv("TMPDIR", "/dev/shm", 0);
  try {
    return run(argc, argv);
  } catch (const std::exception& exception) {
    std::fprintf(stderr, "crash_points: %s\n", exception.what());
    return 1;
  }
}
