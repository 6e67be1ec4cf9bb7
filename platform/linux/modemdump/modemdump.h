#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <vector>

namespace zal::modemdump {

struct Options {
  std::string directory;
  std::string marker;
  std::string reason;
  std::chrono::seconds limit{60};
  std::chrono::seconds listening{2};
  std::string root;   ///< before /dev, /proc, /sys and /var: for tests
  std::string tools;  ///< searched instead of PATH: for tests
};
/// Nothing for words that are none of these options.
[[nodiscard]] std::optional<Options> parseOptions(const std::vector<std::string>& words);

/// Runs lirra-modemdump with these arguments, the program's name not among them. Returned: its exit
/// code.
[[nodiscard]] int run(const std::vector<std::string>& words);

}  // namespace zal::modemdump
