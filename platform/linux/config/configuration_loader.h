#pragma once

#include <string>
#include <vector>

#include "platform/configuration.h"
#include "platform/linux/config/host_environment.h"

namespace zal {

/// A configuration that can be worked with, whatever was wrong in the file.
struct LoadedConfiguration {
  Configuration configuration;
  std::string file;                   ///< the file that was read or should have been; empty: none
  std::vector<std::string> warnings;  ///< each one line, beginning "file:line: "
};

/// Finds and reads lirra.toml. A key that is unknown or has no usable value costs a warning and
/// keeps its default; the other keys stand. A file that cannot be read or parsed leaves all
/// defaults. Any thread.
class ConfigurationLoader {
 public:
  explicit ConfigurationLoader(HostEnvironment environment) : _environment(std::move(environment)) {}
  [[nodiscard]] LoadedConfiguration load() const;
  /// Every key that load() understands, as "section.key"; `[commands]` takes others too.
  [[nodiscard]] static std::vector<std::string> knownKeys();

 private:
  void _readFile(LoadedConfiguration& result) const;
  HostEnvironment _environment;
};

}  // namespace zal
