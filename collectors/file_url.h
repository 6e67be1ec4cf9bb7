#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The file URL of an absolute path ("file:///var/log/a%20b"): how copies are named in the log, so
/// that a path ends where it ends, whatever bytes it holds.
[[nodiscard]] std::string fileUrl(std::string_view path);

}  // namespace zal
