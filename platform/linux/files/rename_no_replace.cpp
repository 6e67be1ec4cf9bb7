#include "platform/linux/files/rename_no_replace.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/linux/files/system_error.h"

namespace zal {

std::error_code renameNoReplace(const std::string& source, const std::string& target) {
  if (::renameat2(AT_FDCWD, source.c_str(), AT_FDCWD, target.c_str(), RENAME_NOREPLACE) == 0) return {};
  if (errno == EINVAL || errno == ENOSYS) return renameNoReplaceInSteps(source, target);
  return lastSystemError();
}

std::error_code renameNoReplaceInSteps(const std::string& source, const std::string& target) {
  if (::linkat(AT_FDCWD, source.c_str(), AT_FDCWD, target.c_str(), 0) == 0) {
    if (::unlink(source.c_str()) == 0) return {};
    const std::error_code error = lastSystemError();
    ::unlink(target.c_str());
    return error;
  }
  if (errno != EPERM && errno != EOPNOTSUPP && errno != EMLINK) return lastSystemError();
  std::error_code error;
  if (nameIsTaken(target, error)) return std::make_error_code(std::errc::file_exists);
  if (error) return error;
  return ::rename(source.c_str(), target.c_str()) == 0 ? std::error_code{} : lastSystemError();
}

bool nameIsTaken(const std::string& path, std::error_code& error) {
  struct stat status {};
  error.clear();
  if (::lstat(path.c_str(), &status) == 0) return true;
  if (errno != ENOENT && errno != ENOTDIR) error = lastSystemError();
  return false;
}

}  // namespace zal
