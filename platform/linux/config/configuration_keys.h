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

/// Whether the section takes keys that are not among these: rows of `[commands]`, whose ids are their
/// table's own.
[[nodiscard]] bool isOpenSection(std::string_view section);
/// Takes such a key's value. Returned: what is wrong with it, else "".
[[nodiscard]] std::string takeOpenKey(std::string_view key, const toml::node& value,
                                      Configuration& configuration);

}  // namespace zal
