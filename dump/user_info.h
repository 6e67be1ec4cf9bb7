#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "platform/value.h"

namespace zal {

// Reading the options that a client gives with an action. A missing dictionary holds nothing.

/// The text under the key; nothing when it is absent or no text.
[[nodiscard]] std::optional<std::string> textOf(const ValueMap* userInfo, std::string_view key);
/// The number under the key cut to 32 bits, as integer conversions cut; 0 when it is absent or none.
[[nodiscard]] std::int32_t integerOf(const ValueMap* userInfo, std::string_view key);
/// The truth under the key: a boolean, or a number that is not 0; nothing when it is absent.
[[nodiscard]] std::optional<bool> booleanOf(const ValueMap* userInfo, std::string_view key);

}  // namespace zal
