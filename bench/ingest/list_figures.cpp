#include "bench/ingest/list_figures.h"

#include "bench/support/figure_lines.h"
#include "bench/support/scratch_folder.h"

namespace zal::bench {

std::map<std::string, double> runListBench(const std::filesystem::path& programs, std::uint64_t entries,
                                           unsigned rounds) {
  const ScratchFolder folder;
  return figureLinesOf({(programs / "list_bench").string(), folder.path().string(), std::to_string(entries),
                        std::to_string(rounds)})
      .figures;
}

}  // namespace zal::bench
