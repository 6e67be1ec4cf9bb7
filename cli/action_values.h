#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <variant>

namespace zal {

/// What an action takes along under one key.
struct ActionValue {
  std::string key;
  std::variant<std::int64_t, bool, std::string> value;
};

/// From "key=value": a whole number, true or false, else a text; always a text when `forceText`.
/// Nothing without a key and a "=".
[[nodiscard]] std::optional<ActionValue> parseActionValue(std::string_view text, bool forceText);

/// A set of flags as a decimal or "0x" number of at most 32 bits.
[[nodiscard]] std::optional<std::uint32_t> parseFlags(std::string_view text);

}  // namespace zal
