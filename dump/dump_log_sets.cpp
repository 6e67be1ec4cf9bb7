#include "dump/dump_log_sets.h"

#include <algorithm>

namespace zal {
namespace {

char lowered(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

bool equalIgnoringCase(std::string_view text, std::string_view other) {
  return std::equal(text.begin(), text.end(), other.begin(), other.end(),
                    [](char a, char b) { return lowered(a) == lowered(b); });
}

bool usesMessagingStack(std::string_view sessionType) {
  return equalIgnoringCase(sessionType, "Nexa") || equalIgnoringCase(sessionType, "Messages") ||
         equalIgnoringCase(sessionType, "Vistel") || sessionType.starts_with("Game");
}

}  // namespace

std::vector<std::string> dumpLogSets(std::string_view sessionType) {
  std::vector<std::string> sets{std::string(sessionType)};
  if (usesMessagingStack(sessionType)) {
    sets.insert(sets.end(), {"Nexa", "NexaIDQuery", "Registration", "Transport", "Plinth"});
  }
  return sets;
}

}  // namespace zal
