#pragma once

#include <optional>
#include <string>
#include <vector>

namespace zal {

enum class HiddenEntries { listed, skipped };

/// The names in a directory, in the host's order, without what is below them. Hidden names begin
/// with a dot. Nothing when the directory cannot be read to its end.
[[nodiscard]] std::optional<std::vector<std::string>> listDirectory(const std::string& directory,
                                                                    HiddenEntries hidden);

}  // namespace zal
