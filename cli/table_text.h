#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace zal {

/// "1.4 MiB".
[[nodiscard]] std::string sizeText(std::uint64_t bytes);

/// Filled up with blanks to the width, on the right unless `right` sets the text to the right. Columns
/// count bytes: exact for what the agent itself names, good enough for the rest.
[[nodiscard]] std::string padded(std::string text, std::size_t width, bool right = false);

}  // namespace zal
