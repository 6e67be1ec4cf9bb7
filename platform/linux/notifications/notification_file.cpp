#include "platform/linux/notifications/notification_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <filesystem>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

constexpr mode_t kDirectoryMode = 0700;
constexpr std::size_t kLongestName = 200;
constexpr std::size_t kLongestId = 64;
constexpr std::string_view kPostPrefix = ".post-";

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
  // A link is none: what it leads to need not be ours.
  const bool isDirectory = std::filesystem::is_directory(std::filesystem::symlink_status(directory, error));
  return isDirectory ? std::error_code{} : std::make_error_code(std::errc::not_a_directory);
}

bool isPostId(std::string_view id) {
  return !id.empty() && id.size() <= kLongestId && std::all_of(id.begin(), id.end(), [](char c) {
    return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
  });
}

std::string nameOfPost(std::string_view id) { return std::string(kPostPrefix).append(id); }

std::string_view idOfPost(std::string_view formerName) {
  if (!formerName.starts_with(kPostPrefix)) return {};
  formerName.remove_prefix(kPostPrefix.size());
  return isPostId(formerName) ? formerName : std::string_view();
}

std::error_code postNotification(const std::string& directory, std::string_view name, std::string_view id) {
  if (!isNotificationName(name) || !(id.empty() || isPostId(id))) {
    return std::make_error_code(std::errc::invalid_argument);
  }
  if (const std::error_code error = makeNotificationDirectory(directory)) return error;
  // A rename of the same name over an older post is an event of its own.
  const std::string path = directory + "/" + std::string(name);
  if (id.empty()) return placeWholeFile(path, "", ExistingFile::isReplaced);
  // The kernel tells watchers both names of a rename, in one piece with it.
  const std::string made = directory + "/" + nameOfPost(id);
  const Descriptor file(::open(made.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
  if (!file.isOpen()) return lastSystemError();
  if (::rename(made.c_str(), path.c_str()) == 0) return {};
  const std::error_code error = lastSystemError();
  ::unlink(made.c_str());
  return error;
}

}  // namespace zal
