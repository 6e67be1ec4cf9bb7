#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The path with "~" in the place of the home directory when it lies in it, else the path as it is.
[[nodiscard]] std::string homeRelativePath(std::string_view path, std::string_view home);

}  // namespace zal
