#pragma once

#include <span>
#include <string>
#include <string_view>

#include <toml++/toml.h>

#include "platform/configuration.h"

namespace zal {

/// Takes a key's value into the configuration. Returned: what is wrong with the value, else "".
using TakeValue = std::string (*)(const toml::node& value, const std::string& homeDirectory,
                                  Configuration& configuration);

/// One key of lirra.toml.
struct ConfigurationKey {
  std::string_view section;
  std::string_view name;
  TakeValue take;
};

/// All keys there are, by section.
[[nodiscard]] std::span<const ConfigurationKey> configurationKeys();

}  // namespace zal
