#pragma once

#include <string>

#include <toml++/toml.h>

namespace zal {

/// Why a text is no TOML, as one line that any terminal can show: "3: …", the first line being 1. The
/// parser's own words repeat what stood in the text, whatever that was.
[[nodiscard]] std::string lineAndReason(const toml::parse_error& error);

}  // namespace zal
