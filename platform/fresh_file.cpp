#include "platform/fresh_file.h"

#include <filesystem>
#include <system_error>

namespace zal {

std::FILE* openFreshFile(const std::string& path) {
  std::error_code error;
  const auto status = std::filesystem::symlink_status(path, error);
  if (std::filesystem::is_character_file(status)) return std::fopen(path.c_str(), "wb");
  if (std::filesystem::is_regular_file(status) || std::filesystem::is_symlink(status))
    std::filesystem::remove(path, error);
  // Exclusive: who lays another link there in between makes it fail.
  return std::fopen(path.c_str(), "wbx");
}

}  // namespace zal
