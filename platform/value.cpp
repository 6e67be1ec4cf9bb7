#include "platform/value.h"

#include <charconv>

namespace zal {

std::string numberText(const Number& number) {
  return std::visit(
      [](auto value) -> std::string {
        using Held = decltype(value);
        if constexpr (std::is_same_v<Held, bool>) {
          return value ? "1" : "0";
        } else {
          char text[32];
          const auto result = std::to_chars(text, text + sizeof text, value);
          return {text, result.ptr};
        }
      },
      number);
}

double numberAsDouble(const Number& number) {
  return std::visit([](auto value) { return static_cast<double>(value); }, number);
}

}  // namespace zal
