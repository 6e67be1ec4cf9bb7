#include "platform/linux/config/text_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

namespace zal {
namespace {

constexpr std::size_t kLargestFile = 1U << 20U;

std::error_code readOpenFile(int descriptor, std::string& content) {
  struct stat status {};
  if (::fstat(descriptor, &status) != 0) return {errno, std::generic_category()};
  if (S_ISDIR(status.st_mode)) return std::make_error_code(std::errc::is_a_directory);
  if (!S_ISREG(status.st_mode)) return std::make_error_code(std::errc::invalid_argument);
  content.resize(kLargestFile + 1);
  std::size_t length = 0;
  while (length < content.size()) {
    const ssize_t count = ::read(descriptor, content.data() + length, content.size() - length);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return {errno, std::generic_category()};
    if (count == 0) break;
    length += static_cast<std::size_t>(count);
  }
  if (length > kLargestFile) return std::make_error_code(std::errc::file_too_large);
  content.resize(length);
  return {};
}

}  // namespace

std::error_code readTextFile(const std::string& path, std::string& content) {
  content.clear();
  const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY);
  if (descriptor < 0) return {errno, std::generic_category()};
  const std::error_code error = readOpenFile(descriptor, content);
  ::close(descriptor);
  if (error) content.clear();
  return error;
}

}  // namespace zal
