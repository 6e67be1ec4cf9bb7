#include "platform/linux/files/unfinished_files.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>

#include "platform/linux/files/changed_at.h"
#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/directory_tree.h"
#include "platform/linux/files/whole_file.h"

namespace zal {
namespace {

/// Between a file and its name lie microseconds.
constexpr std::chrono::minutes kLongest{1};

bool isLeft(int directory, const std::string& name, WallTime now) {
  struct stat status {};
  if (!name.starts_with('.') || ::fstatat(directory, name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0 ||
      !S_ISREG(status.st_mode) || status.st_uid != ::geteuid()) {
    return false;
  }
  if (const auto maker = makerOfUnfinished(name)) return ::kill(*maker, 0) != 0 && errno == ESRCH;
  return std::chrono::abs(now - changedAt(status)) > kLongest;
}

}  // namespace

std::size_t removeUnfinishedFiles(const std::string& directory, WallTime now) {
  const Descriptor opened = openDirectoryAt(AT_FDCWD, directory);
  if (!opened.isOpen()) return 0;
  std::size_t removed = 0;
  for (const std::string& name : namesAt(opened.get())) {
    if (isLeft(opened.get(), name, now) && ::unlinkat(opened.get(), name.c_str(), 0) == 0) ++removed;
  }
  return removed;
}

}  // namespace zal
