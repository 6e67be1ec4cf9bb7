#include "platform/linux/files/directory_names.h"

#include <algorithm>
#include <filesystem>

namespace zal {

std::vector<std::string> namesIn(const std::string& directory, std::error_code& error) {
  std::vector<std::string> names;
  std::filesystem::directory_iterator entry(directory, error);
  for (; !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) {
    names.push_back(entry->path().filename().string());
  }
  std::sort(names.begin(), names.end());
  return names;
}

std::vector<std::string> namesIn(const std::string& directory) {
  std::error_code ignored;
  return namesIn(directory, ignored);
}

}  // namespace zal
