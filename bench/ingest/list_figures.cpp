#include "bench/ingest/list_figures.h"

#include <cstdio>

#include "bench/support/scratch_folder.h"

namespace zal::bench {

std::map<std::string, double> runListBench(const std::filesystem::path& programs, std::uint64_t entries,
                                           unsigned rounds) {
  const ScratchFolder folder;
  const std::string command = "'" + (programs / "list_bench").string() + "' '" + folder.path().string() +
                              "' " + std::to_string(entries) + " " + std::to_string(rounds);
  std::map<std::string, double> figures;
  FILE* lines = popen(command.c_str(), "r");
  if (lines == nullptr) return figures;
  char name[64];
  double value = 0;
  while (fscanf(lines, "%63s %lf", name, &value) == 2) figures[name] = value;
  return pclose(lines) == 0 ? figures : std::map<std::string, double>();
}

}  // namespace zal::bench
