#pragma once

#include <cstddef>
#include <string>

namespace zal {

/// Filled up with blanks to the width, on the right unless `right` sets the text to the right. Columns
/// count bytes: exact for what the agent itself names, good enough for the rest.
[[nodiscard]] std::string padded(std::string text, std::size_t width, bool right = false);

}  // namespace zal
