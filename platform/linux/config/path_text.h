#pragma once

#include <string>
#include <string_view>

namespace zal {

/// The path without slashes at its end; "/" stays.
[[nodiscard]] inline std::string withoutTrailingSlashes(std::string_view path) {
  while (path.size() > 1 && path.back() == '/') path.remove_suffix(1);
  return std::string(path);
}

/// The directory part of an absolute path: "/etc" for "/etc/lirra", "/" for "/etc".
[[nodiscard]] inline std::string parentDirectory(std::string_view path) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string_view::npos) return ".";
  return std::string(path.substr(0, slash == 0 ? 1 : slash));
}

}  // namespace zal
