#include "platform/linux/files/root_parents.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <filesystem>
#include <string>

namespace zal {
namespace {

bool liesIn(const std::string& path, const std::string& directory) {
  return path == directory || path.starts_with(directory + "/");
}

void makePrivate(const std::filesystem::path& directory) {
  std::filesystem::path reached;
  for (const auto& component : directory) {
    reached /= component;
    // Exclusive: what somebody made a moment ago keeps its mode.
    ::mkdir(reached.c_str(), S_IRWXU);
  }
}

}  // namespace

void makeRootParents(const DirectoryRoots& roots) {
  const std::array<const std::string*, 5> written = {&roots.UserLogRoot, &roots.MobileLogRoot,
                                                     &roots.DiagnosticReportRoot, &roots.SystemReportRoot,
                                                     &roots.TemporaryRoot};
  for (const std::string* const root : written) {
    const std::filesystem::path parent = std::filesystem::path(*root).parent_path();
    const bool isBelowARoot = std::any_of(written.begin(), written.end(), [&](const std::string* other) {
      return liesIn(parent.string(), *other);
    });
    std::error_code error;
    if (!isBelowARoot && !std::filesystem::exists(parent, error)) makePrivate(parent);
  }
}

}  // namespace zal
