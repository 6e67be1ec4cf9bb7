#pragma once

#include <istream>
#include <ostream>
#include <string>
#include <vector>

#include "cli/tool_host.h"

namespace zal {

/// Runs lirractl with these arguments, the program's name not among them. Returned: its exit code.
[[nodiscard]] int runTool(const std::vector<std::string>& arguments, ToolHost& host, std::istream& in,
                          std::ostream& out, std::ostream& err);

}  // namespace zal
