#include "platform/standard_path.h"

#include <filesystem>
#include <system_error>

namespace zal {

std::string resolveAndStandardize(std::string_view path, std::string_view home) {
  std::string expanded(path);
  if (path == "~" || path.substr(0, 2) == "~/") expanded = std::string(home).append(path.substr(1));
  std::error_code error;
  std::filesystem::path resolved = std::filesystem::weakly_canonical(expanded, error);
  if (error) resolved = std::filesystem::path(expanded).lexically_normal();
  std::string text = resolved.string();
  while (text.size() > 1 && text.back() == '/') text.pop_back();
  return text;
}

}  // namespace zal
