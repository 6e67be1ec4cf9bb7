#pragma once

#include <cstdint>
#include <string>

namespace zal {

/// "1.4 MiB".
[[nodiscard]] std::string sizeText(std::uint64_t bytes);

}  // namespace zal
