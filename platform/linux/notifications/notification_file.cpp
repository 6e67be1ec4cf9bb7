#include "platform/linux/notifications/notification_file.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>

#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

constexpr mode_t kDirectoryMode = 0700;
constexpr std::size_t kLongestName = 200;

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
  // A rename of the same name over an older post is an event of its own.
  return placeWholeFile(directory + "/" + std::string(name), "", ExistingFile::isReplaced);
}

}  // namespace zal
