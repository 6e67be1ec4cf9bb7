#include "platform/open_directories.h"

#include <filesystem>

namespace zal {

std::error_code createDirectoriesWithMode0777(const std::string& path) {
  namespace fs = std::filesystem;
  std::error_code error;
  fs::path reached;
  for (const auto& component : fs::path(path)) {
    reached /= component;
    if (fs::is_directory(reached, error)) continue;
    const bool made = fs::create_directory(reached, error);
    if (error) return error;
    if (!made) continue;  // somebody else was faster
    // Not through a link that was put in its place since.
    fs::permissions(reached, fs::perms::all, fs::perm_options::replace | fs::perm_options::nofollow, error);
    if (error) return error;
  }
  return fs::is_directory(path, error) ? std::error_code{} : std::make_error_code(std::errc::not_a_directory);
}

}  // namespace zal
