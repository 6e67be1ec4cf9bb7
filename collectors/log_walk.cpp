#include "collectors/log_walk.h"

#include <algorithm>
#include <exception>

#include "collectors/directory_listing.h"
#include "platform/agent_log.h"
#include "platform/file_placement.h"
#include "platform/standard_path.h"

namespace zal {

void walkLogs(AgentLog& log, std::string_view kind, const std::function<void()>& walk) {
  try {
    walk();
  } catch (const std::exception& exception) {
    log.warning("Exception processing " + std::string(kind) + ": " + exception.what());
  }
}

std::vector<std::string> sortedNames(const std::string& directory, FilePlacement& placement) {
  auto names =
      listDirectory(resolveAndStandardize(directory, placement.homeDirectory()), HiddenEntries::listed);
  if (!names) return {};
  std::sort(names->begin(), names->end());
  return *std::move(names);
}

}  // namespace zal
