#pragma once

#include <chrono>

namespace zal::secretlist {

/// From now on the process has that long; then it says so on the standard error and ends with status
/// 1, whatever it waits for. The next call sets a new limit.
void limitTime(std::chrono::seconds limit);

}  // namespace zal::secretlist
