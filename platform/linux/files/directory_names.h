#pragma once

#include <string>
#include <system_error>
#include <vector>

namespace zal {

/// What lies in the directory, in the order of bytes; as far as it could be read, with the error that ended
/// it. Any thread.
[[nodiscard]] std::vector<std::string> namesIn(const std::string& directory, std::error_code& error);
/// The same; one that cannot be read is as good as empty.
[[nodiscard]] std::vector<std::string> namesIn(const std::string& directory);

}  // namespace zal
