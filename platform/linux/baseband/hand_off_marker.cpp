#include "platform/linux/baseband/hand_off_marker.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/linux/files/system_error.h"

namespace zal {
namespace {

constexpr int kPlain = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;

Descriptor openOrMake(const std::string& path) {
  Descriptor file(::open(path.c_str(), kPlain | O_CREAT, 0644));
  // In a directory for everyone the kernel may refuse to "make" what another user has made already.
  if (!file.isOpen() && errno == EACCES) return Descriptor(::open(path.c_str(), kPlain));
  return file;
}

/// Between opening and locking the holder before may have removed the file.
bool stillHasName(const Descriptor& file, const std::string& path) {
  struct stat held {};
  struct stat named {};
  return ::fstat(file.get(), &held) == 0 && ::lstat(path.c_str(), &named) == 0 &&
         held.st_ino == named.st_ino && held.st_dev == named.st_dev;
}

}  // namespace

std::error_code HandOffMarker::place(const std::string& path) {
  return openOrMake(path).isOpen() ? std::error_code{} : lastSystemError();
}

std::variant<HandOffMarker, std::error_code> HandOffMarker::take(const std::string& path) {
  for (;;) {
    Descriptor file = openOrMake(path);
    if (!file.isOpen()) return lastSystemError();
    if (::flock(file.get(), LOCK_EX | LOCK_NB) != 0) {
      if (errno == EWOULDBLOCK) return std::make_error_code(std::errc::device_or_resource_busy);
      return lastSystemError();
    }
    if (stillHasName(file, path)) return HandOffMarker(path, std::move(file));
  }
}

void HandOffMarker::removeUnlessHeld(const std::string& path) {
  const Descriptor file(::open(path.c_str(), kPlain));
  if (file.isOpen() && ::flock(file.get(), LOCK_EX | LOCK_NB) == 0 && stillHasName(file, path))
    ::unlink(path.c_str());
}

HandOffMarker::~HandOffMarker() {
  if (_locked.isOpen()) ::unlink(_path.c_str());
}

}  // namespace zal
