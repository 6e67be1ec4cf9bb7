#include "collectors/directory_listing.h"

#include <filesystem>
#include <system_error>

namespace zal {

std::optional<std::vector<std::string>> listDirectory(const std::string& directory, HiddenEntries hidden) {
  std::vector<std::string> names;
  std::error_code error;
  std::filesystem::directory_iterator entry(directory, error);
  for (; !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) {
    std::string name = entry->path().filename().string();
    if (hidden == HiddenEntries::skipped && name.front() == '.') continue;
    names.push_back(std::move(name));
  }
  if (error) return std::nullopt;
  return names;
}

}  // namespace zal
