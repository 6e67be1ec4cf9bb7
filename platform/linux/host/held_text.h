#pragma once

#include <chrono>
#include <string>
#include <string_view>

namespace zal {

/// "The main thread was held for 73 ms: request checkpoint". A name may be that of a type as the compiler
/// writes it; it is shown as the source has it, without our namespace.
[[nodiscard]] std::string heldText(std::string_view kind, std::string_view name,
                                   std::chrono::milliseconds held);

}  // namespace zal
