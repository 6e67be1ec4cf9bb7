#include "agent/verbose_log_purge.h"

#include <string>
#include <vector>

#include "collectors/directory_listing.h"
#include "platform/file_placement.h"

namespace zal {
namespace {

using Names = std::vector<std::string>;
constexpr std::string_view kVerboseLogMarker = "-Verbose-";

}  // namespace

void purgeVerboseLogs(FilePlacement& files, const std::string& logRoot,
                      std::span<const std::string_view> types) {
  for (const std::string_view type : types) {
    const std::string directory = logRoot + "/" + std::string(type);
    for (const std::string& name : listDirectory(directory, HiddenEntries::skipped).value_or(Names{})) {
      const std::string path = std::string(directory).append("/").append(name);
      if (path.find(kVerboseLogMarker) != std::string::npos) files.remove(path);
    }
  }
}

}  // namespace zal
