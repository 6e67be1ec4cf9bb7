#include "platform/standard_path.h"

#include <filesystem>
#include <system_error>

namespace zal {
namespace {

std::string expandedPath(std::string_view path, std::string_view home) {
  const bool isBelowHome = path == "~" || path.starts_with("~/");
  return isBelowHome ? std::string(home).append(path.substr(1)) : std::string(path);
}

bool liesBelow(std::string_view path, std::string_view directory) {
  return !directory.empty() && path.starts_with(directory) &&
         (directory.ends_with('/') || path.substr(directory.size()).starts_with('/'));
}

std::string asText(const std::filesystem::path& path) {
  std::string text = path.lexically_normal().string();
  while (text.size() > 1 && text.back() == '/') text.pop_back();
  return text;
}

}  // namespace

std::string standardizeBelowRoot(std::string_view path, std::string_view root, std::string_view home) {
  const std::string whole = asText(expandedPath(path, home));
  const std::string resolvedRoot = resolveAndStandardize(root, home);
  if (liesBelow(whole, resolvedRoot)) return whole;
  const std::string plainRoot = asText(expandedPath(root, home));
  if (!liesBelow(whole, plainRoot)) return resolveAndStandardize(path, home);
  return asText(resolvedRoot + "/" + whole.substr(plainRoot.size()));
}

std::string resolveAndStandardize(std::string_view path, std::string_view home) {
  const std::string expanded = expandedPath(path, home);
  std::error_code error;
  std::filesystem::path resolved = std::filesystem::weakly_canonical(expanded, error);
  if (error) resolved = expanded;
  return asText(resolved);
}

}  // namespace zal
