#include "platform/linux/config/text_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <string_view>

#include "platform/linux/config/path_text.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

std::error_code readOpenFile(int descriptor, std::string& content, std::size_t mostBytes) {
  struct stat status {};
  if (::fstat(descriptor, &status) != 0) return lastSystemError();
  if (S_ISDIR(status.st_mode)) return std::make_error_code(std::errc::is_a_directory);
  if (!S_ISREG(status.st_mode)) return std::make_error_code(std::errc::invalid_argument);
  // One byte more than there should be: a file may grow, and generated ones claim to be empty.
  content.resize(std::min(static_cast<std::size_t>(status.st_size), mostBytes) + 1);
  std::size_t length = 0;
  while (length <= mostBytes) {
    if (length == content.size()) content.resize(std::min(length * 2, mostBytes + 1));
    const ssize_t count = ::read(descriptor, content.data() + length, content.size() - length);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return lastSystemError();
    if (count == 0) break;
    length += static_cast<std::size_t>(count);
  }
  if (length > mostBytes) return std::make_error_code(std::errc::file_too_large);
  content.resize(length);
  return {};
}

std::error_code writeAndSync(int descriptor, std::string_view content) {
  if (const std::error_code error = writeWhole(descriptor, content)) return error;
  if (::fsync(descriptor) != 0) return lastSystemError();
  return {};
}

}  // namespace

std::error_code readTextFile(const std::string& path, std::string& content, std::size_t mostBytes) {
  content.clear();
  int descriptor = -1;
  do {
    descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY);
  } while (descriptor < 0 && errno == EINTR);
  if (descriptor < 0) return lastSystemError();
  const std::error_code error = readOpenFile(descriptor, content, mostBytes);
  ::close(descriptor);
  if (error) content.clear();
  return error;
}

std::error_code replaceTextFile(const std::string& path, const std::string& content) {
  std::error_code error;
  std::string target = path;
  if (std::filesystem::is_symlink(path, error)) {
    target = std::filesystem::canonical(path, error).string();
    if (error) return error;
  }
  std::filesystem::create_directories(parentDirectory(target), error);
  if (error) return error;
  struct stat old {};
  const mode_t mode = ::stat(target.c_str(), &old) == 0 ? old.st_mode & 07777U : 0644U;
  const std::string temporary = target + "." + std::to_string(::getpid()) + ".tmp";
  const int descriptor =
      ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC, mode);
  if (descriptor < 0) return lastSystemError();
  error = writeAndSync(descriptor, content);
  if (!error && ::fchmod(descriptor, mode) != 0) error = lastSystemError();
  ::close(descriptor);
  if (!error && ::rename(temporary.c_str(), target.c_str()) != 0) error = lastSystemError();
  if (error) ::unlink(temporary.c_str());
  return error;
}

}  // namespace zal
