#include "cli/progress_lines.h"

#include <cstdio>

#include "cli/printable_text.h"
#include "cli/table_text.h"
#include "platform/size_text.h"
#include "platform/utf8_walk.h"

namespace zal {
namespace {

constexpr std::size_t kTimeWidth = 8;

}  // namespace

std::string elapsedText(std::chrono::milliseconds elapsed) {
  const long long seconds = std::chrono::floor<std::chrono::seconds>(elapsed).count();
  char text[64];
  if (seconds < 3600) {
    std::snprintf(text, sizeof text, "%lld:%02lld", seconds / 60, seconds % 60);
  } else {
    std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", seconds / 3600, seconds / 60 % 60, seconds % 60);
  }
  return padded(text, kTimeWidth, true);
}

std::string stepLine(const DumpView& dump, std::size_t number, std::chrono::milliseconds elapsed) {
  return elapsedText(elapsed) + "  step " + std::to_string(number) + " of " +
         std::to_string(dump.steps.size()) + ": " + printableLine(dump.steps.at(number - 1).name);
}

std::string missingLine(const DumpView::Missing& missing) {
  return std::string(kTimeWidth, ' ') + "  missing: " + printableLine(missing.what) + ": " +
         printableLine(missing.why);
}

std::string fitting(std::string_view line, std::size_t columns) {
  std::string_view rest = line;
  for (std::size_t column = 0; column < columns && !rest.empty(); ++column)
    rest.remove_prefix(leadingCharacter(rest).length);
  return std::string(line.substr(0, line.size() - rest.size()));
}

}  // namespace zal
