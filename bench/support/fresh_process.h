#pragma once

#include <functional>
#include <vector>

namespace zal::bench {

/// Runs the measurement in a child of its own and hands back its figures. A list of a million entries
/// leaves a heap behind that the next measurement would pay for. The process ends when the child fails.
[[nodiscard]] std::vector<double> inFreshProcess(const std::function<std::vector<double>()>& measure);

}  // namespace zal::bench
