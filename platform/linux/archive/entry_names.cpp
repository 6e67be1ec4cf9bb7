#include "platform/linux/archive/entry_names.h"

#include <algorithm>
#include <set>

#include "platform/linux/wire/utf8.h"

namespace zal {

std::vector<std::string> entryNames(const std::vector<std::string>& names) {
  if (std::all_of(names.begin(), names.end(), isUtf8)) return names;
  // Names that stay as they are come first, whatever stands before them.
  std::set<std::string> taken;
  std::copy_if(names.begin(), names.end(), std::inserter(taken, taken.end()), isUtf8);
  std::vector<std::string> entries;
  for (const std::string& name : names) {
    std::string entry = replacedUtf8(name);
    if (entry != name) {
      const std::string plain = entry;
      for (int number = 2; !taken.insert(entry).second; ++number)
        entry = plain + '-' + std::to_string(number);
    }
    entries.push_back(std::move(entry));
  }
  return entries;
}

}  // namespace zal
