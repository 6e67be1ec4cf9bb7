#include "platform/linux/modemdump/dump_names.h"

#include <algorithm>
#include <cstdio>

namespace zal::modemdump {
namespace {

constexpr std::string_view kForm = "dddd-dd-dd-dd-dd-dd-";
constexpr std::size_t kPrefixLength = kFamily.size() + kForm.size();

bool isOfASet(std::string_view name) {
  if (!name.starts_with(kFamily) || name.size() <= kPrefixLength) return false;
  return std::equal(kForm.begin(), kForm.end(), name.begin() + kFamily.size(), [](char form, char byte) {
    return form == 'd' ? byte >= '0' && byte <= '9' : byte == form;
  });
}

}  // namespace

std::string setPrefix(const LocalTime& time) {
  char stamp[80];
  std::snprintf(stamp, sizeof stamp, "%04d-%02d-%02d-%02d-%02d-%02d-", time.year, time.month, time.day,
                time.hour, time.minute, time.second);
  return std::string(kFamily) + stamp;
}

std::string newSetPrefix(const std::vector<std::string>& names, WallTime moment, const Clock& clock) {
  for (;; moment += std::chrono::seconds{1}) {
    std::string prefix = setPrefix(clock.localTime(moment));
    if (std::none_of(names.begin(), names.end(),
                     [&](const std::string& name) { return name.starts_with(prefix); }))
      return prefix;
  }
}

std::vector<std::string> outdatedNames(std::vector<std::string> names, std::size_t keptSets) {
  std::erase_if(names, [](const std::string& name) { return !isOfASet(name); });
  std::sort(names.begin(), names.end(), std::greater<>());
  std::string_view set;
  std::size_t sets = 0;
  for (auto name = names.begin(); name != names.end(); ++name) {
    const std::string_view own = std::string_view(*name).substr(0, kPrefixLength);
    if (own == set) continue;
    set = own;
    if (++sets > keptSets) return {name, names.end()};
  }
  return {};
}

}  // namespace zal::modemdump
