#include "platform/linux/files/rename_no_replace.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/linux/files/system_error.h"

namespace zal {

std::error_code renameNoReplace(const std::string& source, const std::string& target) {
  return renameNoReplaceAt(AT_FDCWD, source, AT_FDCWD, target);
}

std::error_code renameNoReplaceAt(int sourceDirectory, const std::string& source, int targetDirectory,
                                  const std::string& target) {
  if (::renameat2(sourceDirectory, source.c_str(), targetDirectory, target.c_str(), RENAME_NOREPLACE) == 0)
    return {};
  if (errno == EINVAL || errno == ENOSYS)
    return renameNoReplaceInSteps(sourceDirectory, source, targetDirectory, target);
  return lastSystemError();
}

std::error_code renameNoReplaceInSteps(int sourceDirectory, const std::string& source, int targetDirectory,
                                       const std::string& target) {
  if (::linkat(sourceDirectory, source.c_str(), targetDirectory, target.c_str(), 0) == 0) {
    if (::unlinkat(sourceDirectory, source.c_str(), 0) == 0) return {};
    const std::error_code error = lastSystemError();
    ::unlinkat(targetDirectory, target.c_str(), 0);
    return error;
  }
  if (errno != EPERM && errno != EOPNOTSUPP && errno != EMLINK) return lastSystemError();
  std::error_code error;
  if (nameIsTakenAt(targetDirectory, target, error)) return std::make_error_code(std::errc::file_exists);
  if (error) return error;
  if (::renameat(sourceDirectory, source.c_str(), targetDirectory, target.c_str()) == 0) return {};
  return lastSystemError();
}

bool nameIsTaken(const std::string& path, std::error_code& error) {
  return nameIsTakenAt(AT_FDCWD, path, error);
}

bool nameIsTakenAt(int directory, const std::string& path, std::error_code& error) {
  struct stat status {};
  error.clear();
  if (::fstatat(directory, path.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0) return true;
  if (errno != ENOENT && errno != ENOTDIR) error = lastSystemError();
  return false;
}

}  // namespace zal
