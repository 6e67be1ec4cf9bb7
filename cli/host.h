#pragma once

#include <iosfwd>
#include <memory>

#include "cli/tool_host.h"

namespace zal {

/// The machine this runs on. Warnings about the preference file go to `err`, which outlives it.
[[nodiscard]] std::unique_ptr<ToolHost> thisMachine(std::ostream& err);

}  // namespace zal
