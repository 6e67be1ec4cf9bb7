#pragma once

#include <string_view>

namespace zal {

/// Whether a client's text, taken as one file name, stays in the directory that it is put into: no
/// slash, no NUL, neither "." nor "..". Any thread.
[[nodiscard]] inline bool isPlainName(std::string_view name) {
  return name != "." && name != ".." && name.find('/') == std::string_view::npos &&
         name.find('\0') == std::string_view::npos;
}

}  // namespace zal
