#include "bench/support/figure_lines.h"

#include <cstdio>

namespace zal::bench {

FigureLines figureLinesOf(const std::vector<std::string>& command) {
  std::string words;
  for (const std::string& word : command) words += "'" + word + "' ";
  FigureLines lines;
  FILE* const output = popen(words.c_str(), "r");
  if (output == nullptr) return lines;
  char line[256];
  while (fgets(line, sizeof line, output) != nullptr) {
    char name[64];
    double value = 0;
    if (sscanf(line, "%63s %lf", name, &value) == 2) {
      lines.figures[name] = value;
    } else {
      lines.reason = line;
      lines.reason.erase(lines.reason.find_last_not_of('\n') + 1);
    }
  }
  return pclose(output) == 0 ? lines : FigureLines();
}

}  // namespace zal::bench
