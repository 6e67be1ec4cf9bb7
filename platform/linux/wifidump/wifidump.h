#pragma once

#include <string>
#include <vector>

namespace zal::wifidump {

/// Runs lirra-wifidump with these arguments, the program's name not among them. Returned: its exit code.
[[nodiscard]] int run(const std::vector<std::string>& words);

}  // namespace zal::wifidump
