#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// The log sets that belong to a session type, in the order they are taken: that of the type itself,
/// and for those of the messaging stack and of games all that the stack writes. The type may occur
/// twice.
[[nodiscard]] std::vector<std::string> dumpLogSets(std::string_view sessionType);

}  // namespace zal
