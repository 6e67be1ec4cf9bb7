#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace zal {

class AgentLog;
class FilePlacement;

/// Walks over one directory of logs. What the walk throws ends it and becomes a warning that names
/// the kind of logs ("crash logs").
void walkLogs(AgentLog& log, std::string_view kind, const std::function<void()>& walk);

/// The names in a directory, hidden ones included, in order of their bytes; none when it is missing
/// or cannot be read. The path may begin with "~". Any thread.
[[nodiscard]] std::vector<std::string> sortedNames(const std::string& directory, FilePlacement& placement);

}  // namespace zal
