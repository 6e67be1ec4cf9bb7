#include "agent/verbose_log_purge.h"

#include <filesystem>
#include <system_error>
#include <vector>

namespace zal {
namespace {

constexpr std::string_view kVerboseLogMarker = "-Verbose-";

std::vector<std::filesystem::path> verboseLogs(const std::filesystem::path& directory) {
  std::vector<std::filesystem::path> found;
  std::error_code error;
  std::filesystem::directory_iterator entry(directory, error);
  for (; !error && entry != std::filesystem::directory_iterator{}; entry.increment(error)) {
    const std::string& path = entry->path().native();
    const bool isHidden = entry->path().filename().native().starts_with('.');
    if (!isHidden && path.find(kVerboseLogMarker) != std::string::npos) found.push_back(entry->path());
  }
  return found;
}

}  // namespace

void purgeVerboseLogs(const std::string& logRoot, std::span<const std::string_view> types) {
  for (const std::string_view type : types) {
    const std::filesystem::path directory = std::filesystem::path(logRoot) / type;
    // Listed whole before the first deletion: a directory that changes under its iterator may
    // skip entries.
    for (const std::filesystem::path& path : verboseLogs(directory)) {
      std::error_code ignored;
      std::filesystem::remove_all(path, ignored);
    }
  }
}

}  // namespace zal
