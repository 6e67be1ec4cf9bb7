#pragma once

#include <string>

#include "platform/user_alerts.h"

namespace zal {

/// Tells the person under what name an archive lies.
[[nodiscard]] UserAlert copiedLogsAlert(const std::string& title, const std::string& archive);

}  // namespace zal
