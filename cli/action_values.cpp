#include "cli/action_values.h"

#include <charconv>
#include <cstdint>

namespace zal {
namespace {

template <class Number>
std::optional<Number> numberIn(std::string_view text, int base = 10) {
  Number number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}

}  // namespace

std::optional<ActionValue> parseActionValue(std::string_view text, bool forceText) {
  const std::size_t sign = text.find('=');
  if (sign == std::string_view::npos || sign == 0) return std::nullopt;
  ActionValue result{std::string(text.substr(0, sign)), std::string(text.substr(sign + 1))};
  const std::string_view value = text.substr(sign + 1);
  if (forceText) return result;
  if (const auto number = numberIn<std::int64_t>(value)) {
    result.value = *number;
  } else if (value == "true" || value == "false") {
    result.value = value == "true";
  }
  return result;
}

std::optional<std::uint32_t> parseFlags(std::string_view text) {
  if (text.starts_with("0x") || text.starts_with("0X")) return numberIn<std::uint32_t>(text.substr(2), 16);
  return numberIn<std::uint32_t>(text);
}

}  // namespace zal
