#pragma once

#include <string>

namespace zal::tessel {

/// As log lines show it: up to the first dot.
[[nodiscard]] std::string hostName();

}  // namespace zal::tessel
