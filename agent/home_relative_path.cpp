#include "agent/home_relative_path.h"

namespace zal {
namespace {

std::string_view withoutTrailingSlashes(std::string_view path) {
  while (path.ends_with('/')) path.remove_suffix(1);
  return path;
}

/// Whether the path begins with these whole components.
bool beginsWith(std::string_view path, std::string_view components) {
  return path.starts_with(components) && (path.size() == components.size() || path[components.size()] == '/');
}

}  // namespace

std::string homeRelativePath(std::string_view path, std::string_view home) {
  home = withoutTrailingSlashes(home);
  if (home.empty() || !beginsWith(path, home)) return std::string(path);
  return "~" + std::string(path.substr(home.size()));
}

std::string expandHome(std::string_view path, std::string_view home) {
  if (!beginsWith(path, "~")) return std::string(path);
  return std::string(withoutTrailingSlashes(home)) + std::string(path.substr(1));
}

}  // namespace zal
