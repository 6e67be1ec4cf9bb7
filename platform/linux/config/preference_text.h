#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace zal {

/// The TOML text with that switch at its top level set; every other character stays as it is.
/// Nothing when the text does not parse or the key cannot be set in it: then `reason` begins with
/// the line, as in "3: …".
[[nodiscard]] std::optional<std::string> withSwitch(const std::string& text, std::string_view key, bool value,
                                                    std::string& reason);

}  // namespace zal
