#include "platform/linux/notifications/notification_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <filesystem>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr mode_t kDirectoryMode = 0700;
constexpr std::size_t kLongestName = 200;

std::string temporaryName() {
  static std::atomic<unsigned> counter{0};
  return "/.post-" + std::to_string(::getpid()) + "-" + std::to_string(++counter);
}

}  // namespace

std::string notificationDirectory(const std::string& runtimeRoot) { return runtimeRoot + "/notifications"; }

bool isNotificationName(std::string_view name) {
  if (name.empty() || name.size() > kLongestName || name.front() == '.') return false;
  return std::none_of(name.begin(), name.end(),
                      [](char c) { return c == '/' || static_cast<unsigned char>(c) < 0x20 || c == 0x7f; });
}

std::error_code makeNotificationDirectory(const std::string& directory) {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(directory).parent_path(), error);
  if (error) return error;
  if (::mkdir(directory.c_str(), kDirectoryMode) == 0) return {};
  if (errno != EEXIST) return lastSystemError();
  return std::filesystem::is_directory(directory, error) ? std::error_code{}
                                                         : std::make_error_code(std::errc::not_a_directory);
}

std::error_code postNotification(const std::string& directory, std::string_view name) {
  if (!isNotificationName(name)) return std::make_error_code(std::errc::invalid_argument);
  if (const std::error_code error = makeNotificationDirectory(directory)) return error;
  const std::string temporary = directory + temporaryName();
  const int descriptor =
      ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC, 0600);
  if (descriptor < 0) return lastSystemError();
  ::close(descriptor);
  // A rename of the same name over an older post is an event of its own.
  if (::rename(temporary.c_str(), (directory + "/" + std::string(name)).c_str()) == 0) return {};
  const std::error_code error = lastSystemError();
  ::unlink(temporary.c_str());
  return error;
}

}  // namespace zal
