#pragma once

#include <map>
#include <string>
#include <vector>

namespace zal::bench {

/// What a program of the benchmark's own says on its standard output: lines "name value".
struct FigureLines {
  std::map<std::string, double> figures;
  std::string reason;  ///< a line that is none: why there are no figures
};

/// Empty when the program fails.
[[nodiscard]] FigureLines figureLinesOf(const std::vector<std::string>& command);

}  // namespace zal::bench
