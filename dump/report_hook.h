#pragma once

#include <optional>
#include <string>
#include <vector>

namespace zal {

/// Where a bug-report system would be called. It does nothing and returns 0.
int FileReportHook(const std::optional<std::string>& description, const std::string& component,
                   const std::string& componentVersion, const std::vector<std::string>& archives);

}  // namespace zal
