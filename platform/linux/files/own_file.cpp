#include "platform/linux/files/own_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

namespace zal {
namespace {

constexpr int kWithoutWaiting = O_WRONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;

/// Devices too: only the superuser makes them.
bool isAsItShouldBe(const Descriptor& file) {
  struct stat status {};
  if (::fstat(file.get(), &status) != 0) return false;
  return S_ISCHR(status.st_mode) ||
         (S_ISREG(status.st_mode) && status.st_uid == ::geteuid() && status.st_nlink == 1);
}

}  // namespace

Descriptor openOwnFile(const std::string& path, mode_t mode) { return openOwnFileAt(AT_FDCWD, path, mode); }

Descriptor openOwnFileAt(int directory, const std::string& path, mode_t mode) {
  Descriptor present(::openat(directory, path.c_str(), kWithoutWaiting));
  if (present.isOpen() && isAsItShouldBe(present)) return present;
  if (::unlinkat(directory, path.c_str(), 0) != 0 && errno != ENOENT) {
    // Some kernels say EPERM and some EISDIR of a directory.
    if (errno == EISDIR) errno = EEXIST;
    return {};
  }
  return Descriptor(::openat(directory, path.c_str(), kWithoutWaiting | O_CREAT | O_EXCL, mode));
}

}  // namespace zal
