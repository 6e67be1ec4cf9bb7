#pragma once

#include <string>
#include <vector>

namespace zal::secretlist {

/// Runs secretlist with these arguments, the program's name not among them. Returned: its exit code.
[[nodiscard]] int run(const std::vector<std::string>& words);

}  // namespace zal::secretlist
