// The agent's archives beside those of other programs, of one directory, in one table. Started by bench/run.
//
//     archive_bench [--quick]

#include <stdlib.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "bench/archive/dump_directory.h"
#include "bench/archive/measured_run.h"
#include "bench/archive/own_archive.h"
#include "bench/support/child_process.h"
#include "bench/support/table.h"

namespace zal::bench {
namespace {

/// What may take part: a name for the table, its program, and its arguments, which the name of the
/// archive and that of the directory follow.
struct Contender {
  std::string name;
  std::string program;
  std::vector<std::string> arguments;
  bool copies = false;     // takes the directory first, and its output is one
  bool takesLong = false;  // and has no target: once is enough
};

struct Result {
  RunFigures best;
  double mebibytes = 0;
  std::string missing;
};

constexpr const char* kOwnSmall = "ours, small";
constexpr const char* kOwnFast = "ours, fast";
constexpr const char* kZip = "zip -r";

std::vector<Contender> contenders(const std::string& self) {
  return {{kOwnFast, self, {"--archive", "fast"}},
          {kOwnSmall, self, {"--archive", "small"}},
          {kZip, findProgram("zip"), {"-qr"}},
          {"7z -tzip -mx=1", findProgram("7z"), {"a", "-bd", "-tzip", "-mx=1"}},
          {"7z -tzip", findProgram("7z"), {"a", "-bd", "-tzip"}, false, true},
          {"bsdtar --format zip", findProgram("bsdtar"), {"--format", "zip", "-cf"}},
          {"plain copy (cp -r)", findProgram("cp"), {"-r", "--reflink=never"}, true}};
}

std::uint64_t bytesOf(const std::filesystem::path& path) {
  if (std::filesystem::is_regular_file(path)) return std::filesystem::file_size(path);
  std::uint64_t bytes = 0;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(path)) {
    if (entry.is_regular_file()) bytes += entry.file_size();
  }
  return bytes;
}

/// One more run; the better figures stay. The programs' outputs are looked at once and removed.
void runOnce(const Contender& contender, const std::filesystem::path& folder, Result& result) {
  if (contender.program.empty()) result.missing = "not installed";
  if (!result.missing.empty()) return;
  std::vector<std::string> command{contender.program};
  command.insert(command.end(), contender.arguments.begin(), contender.arguments.end());
  const std::string output = contender.copies ? "copy" : "archive.zip";
  if (contender.copies) {
    command.insert(command.end(), {"Dump", output});
  } else {
    command.insert(command.end(), {output, "Dump"});
  }
  const RunFigures figures = measureRun(command, folder);
  if (!figures.succeeded) {
    result.missing = "failed";
    return;
  }
  result.mebibytes = static_cast<double>(bytesOf(folder / output)) / (1U << 20U);
  std::filesystem::remove_all(folder / output);
  RunFigures& best = result.best;
  best.seconds = best.succeeded ? std::min(best.seconds, figures.seconds) : figures.seconds;
  best.cpuSeconds = best.succeeded ? std::min(best.cpuSeconds, figures.cpuSeconds) : figures.cpuSeconds;
  best.peakMebibytes = std::max(best.peakMebibytes, figures.peakMebibytes);
  best.succeeded = true;
}

std::string mebibytes(double value) { return decimal(value, 2) + " MiB"; }
std::string mebibytesPerSecond(double value) { return decimal(value, 0) + " MiB/s"; }

void printFigures(const std::vector<Contender>& all, const std::map<std::string, Result>& results) {
  printf("%-22s  %9s  %9s  %11s  %11s\n", "archive by", "wall", "CPU", "peak memory", "size");
  for (const Contender& contender : all) {
    const Result& result = results.at(contender.name);
    if (!result.missing.empty()) {
      printf("%-22s  skipped: %s\n", contender.name.c_str(), result.missing.c_str());
      continue;
    }
    printf("%-22s  %9s  %9s  %11s  %11s\n", contender.name.c_str(), duration(result.best.seconds).c_str(),
           duration(result.best.cpuSeconds).c_str(), mebibytes(result.best.peakMebibytes).c_str(),
           mebibytes(result.mebibytes).c_str());
  }
  printf("\n");
}

/// `speed` and `size` are the targets beside zip; without one for the others.
std::vector<Row> comparison(const char* own, double total, const std::vector<Contender>& all,
                            const std::map<std::string, Result>& results, double speed, double size) {
  const Result& mine = results.at(own);
  std::vector<Row> rows;
  if (!mine.missing.empty()) return {skipped(own, mine.missing)};
  for (const Contender& contender : all) {
    const std::string& name = contender.name;
    if (name == kOwnSmall || name == kOwnFast) continue;
    const Result& result = results.at(name);
    const std::string pair = std::string(own) + " : " + name;
    if (!result.missing.empty()) {
      rows.push_back(skipped(pair, result.missing));
      continue;
    }
    const double rate = total / mine.best.seconds;
    const double otherRate = total / result.best.seconds;
    if (name == kZip) {
      rows.push_back(atLeast(pair + ", speed", rate, otherRate, speed, mebibytesPerSecond));
      rows.push_back(atMost(pair + ", size", mine.mebibytes, result.mebibytes, size, mebibytes));
    } else {
      rows.push_back(plain(pair + ", speed", rate, otherRate, mebibytesPerSecond));
      rows.push_back(plain(pair + ", size", mine.mebibytes, result.mebibytes, mebibytes));
    }
  }
  rows.push_back({std::string(own) + ", peak memory", mebibytes(mine.best.peakMebibytes), "", "",
                  "at most 32 MiB", mine.best.peakMebibytes <= 32 ? "met" : "MISSED"});
  return rows;
}

int compare(const std::string& self, bool quick) {
  // On a disk, not in memory: the sync is part of an archive's time.
  std::string name = (std::filesystem::temp_directory_path() / "zal-archive-XXXXXX").string();
  if (mkdtemp(name.data()) == nullptr) {
    perror(name.c_str());
    return 1;
  }
  const std::filesystem::path folder = name;
  const unsigned rounds = quick ? 1 : 3;
  const DumpDirectory made = makeDumpDirectory(folder / "Dump", quick ? 4'000'000 : 300U << 20U);
  const double total = static_cast<double>(made.bytes) / (1U << 20U);
  const std::vector<Contender> all = contenders(self);
  std::map<std::string, Result> results;
  for (unsigned round = 0; round < rounds; ++round) {
    for (const Contender& contender : all) {
      if (round > 0 && contender.takesLong) continue;
      fprintf(stderr, "round %u of %u: %s\n", round + 1, rounds, contender.name.c_str());
      runOnce(contender, folder, results[contender.name]);
    }
  }
  std::filesystem::remove_all(folder);
  printf("\narchives of %llu files, %.1f MiB, below %s; best of %u rounds\n\n",
         static_cast<unsigned long long>(made.files), total, folder.parent_path().c_str(), rounds);
  printFigures(all, results);
  std::vector<Row> rows = comparison(kOwnFast, total, all, results, 12, 1.07);
  for (Row& row : comparison(kOwnSmall, total, all, results, 3.8, 1)) rows.push_back(std::move(row));
  if (quick) {
    for (Row& row : rows) row.target = row.verdict = "";
    printf("A quick run: it shows that the benchmark works, its figures mean nothing.\n\n");
  }
  printTable(rows);
  return results[kOwnFast].missing.empty() && results[kOwnSmall].missing.empty() ? 0 : 1;
}

}  // namespace
}  // namespace zal::bench

int main(int count, char** arguments) {
  if (count == 5 && strcmp(arguments[1], "--archive") == 0) {
    const bool small = strcmp(arguments[2], "small") == 0;
    const auto compression = small ? zal::ArchiveCompression::small : zal::ArchiveCompression::fast;
    return zal::bench::makeOwnArchive(arguments[4], arguments[3], compression) ? 0 : 1;
  }
  const bool quick = count == 2 && strcmp(arguments[1], "--quick") == 0;
  if (count > 2 || (count == 2 && !quick)) {
    fprintf(stderr, "usage: archive_bench [--quick]\n");
    return 2;
  }
  return zal::bench::compare(std::filesystem::read_symlink("/proc/self/exe").string(), quick);
}
