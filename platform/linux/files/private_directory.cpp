#include "platform/linux/files/private_directory.h"

#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <filesystem>
#include <system_error>

#include "platform/linux/files/system_error.h"

namespace zal {

std::string randomName() {
  std::array<unsigned char, 16> bytes{};
  ssize_t got = 0;
  do {
    got = ::getrandom(bytes.data(), bytes.size(), 0);
  } while (got < 0 && errno == EINTR);
  if (got != static_cast<ssize_t>(bytes.size())) throw std::system_error(lastSystemError(), "getrandom");
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string name;
  for (const unsigned char byte : bytes) {
    name += kDigits[byte >> 4U];
    name += kDigits[byte & 15U];
  }
  return name;
}

bool ensurePrivateDirectory(const std::string& path) {
  std::error_code ignored;  // a missing parent shows in the next call
  std::filesystem::create_directories(std::filesystem::path(path).parent_path(), ignored);
  if (::mkdir(path.c_str(), S_IRWXU) != 0 && errno != EEXIST) return false;
  struct stat status {};
  if (::lstat(path.c_str(), &status) != 0) return false;
  if (!S_ISDIR(status.st_mode) || status.st_uid != ::geteuid()) return false;
  if ((status.st_mode & (S_IRWXU | S_IRWXG | S_IRWXO)) == S_IRWXU) return true;
  return ::chmod(path.c_str(), S_IRWXU) == 0;
}

}  // namespace zal
