#include "platform/linux/config/toml_error.h"

#include "platform/linux/files/escaped_text.h"

namespace zal {

std::string lineAndReason(const toml::parse_error& error) {
  constexpr std::size_t kLongest = 400;
  return std::to_string(error.source().begin.line) + ": " +
         escapedLine(cutAtCharacter(error.description(), kLongest));
}

}  // namespace zal
