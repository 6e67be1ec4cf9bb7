#include "agent/home_relative_path.h"

namespace zal {
namespace {

std::string_view withoutTrailingSlashes(std::string_view path) {
  while (path.ends_with('/')) path.remove_suffix(1);
  return path;
}

}  // namespace

std::string homeRelativePath(std::string_view path, std::string_view home) {
  home = withoutTrailingSlashes(home);
  const bool isBelow = !home.empty() && path.starts_with(home);
  const std::string_view rest = path.substr(isBelow ? home.size() : 0);
  if (!isBelow || (!rest.empty() && rest.front() != '/')) return std::string(path);
  return "~" + std::string(rest);
}

}  // namespace zal
