#pragma once

#include <optional>
#include <string>
#include <vector>

namespace zal {

/// What the agent was asked for when it was started.
struct CommandLine {
  std::optional<std::string> configFile;  ///< `--config FILE`: instead of $LIRRA_CONFIG
  std::optional<std::string> socketPath;  ///< `--socket PATH`: instead of $LIRRA_SOCKET
  bool help = false;
  bool version = false;
  std::optional<std::string> trouble;  ///< one sentence, when the rest cannot be followed

  /// Values may follow their option as the next word or after "=". The last one counts.
  [[nodiscard]] static CommandLine parse(const std::vector<std::string>& arguments);
  [[nodiscard]] static std::string helpText();
};

}  // namespace zal
