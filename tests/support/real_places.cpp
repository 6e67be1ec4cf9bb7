#include "tests/support/real_places.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <sstream>
#include <system_error>
#include <utility>

namespace zal::testing {

OtherFileSystem::OtherFileSystem() {
  struct stat here {
  }, there{};
  std::string pattern = "/dev/shm/zal-XXXXXX";
  if (::stat("/dev/shm", &there) != 0 || ::mkdtemp(pattern.data()) == nullptr) {
    missing = "/dev/shm cannot be written to";
    return;
  }
  ::stat(std::filesystem::temp_directory_path().c_str(), &here);
  if (here.st_dev == there.st_dev) {
    missing = "/dev/shm and the temporary directory are one file system";
    ::rmdir(pattern.c_str());
    return;
  }
  path = pattern;
}

OtherFileSystem::~OtherFileSystem() {
  std::error_code ignored;
  if (!path.empty()) std::filesystem::remove_all(path, ignored);
}

TinyFileSystem::TinyFileSystem(std::string directory) : _directory(std::move(directory)) {
  std::filesystem::create_directories(_directory);
  if (::mount("tmpfs", _directory.c_str(), "tmpfs", 0, "size=64k") != 0) {
    missing = std::string("a tmpfs cannot be mounted here: ") + std::strerror(errno);
  }
}

TinyFileSystem::~TinyFileSystem() {
  if (missing.empty()) ::umount2(_directory.c_str(), MNT_DETACH);
}

std::string modeAndTime(const std::string& path) {
  struct stat status {};
  if (::lstat(path.c_str(), &status) != 0) return "missing";
  std::ostringstream text;
  text << std::oct << (status.st_mode & 07777U) << ' ' << std::dec
       << status.st_mtim.tv_sec * 1'000'000'000 + status.st_mtim.tv_nsec;
  return text.str();
}

void setTime(const std::string& path, long seconds, long nanoseconds) {
  const timespec times[2] = {{seconds, nanoseconds}, {seconds, nanoseconds}};
  if (::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW) != 0) {
    throw std::system_error(errno, std::generic_category(), path);
  }
}

void makeNamedPipe(const std::string& path) {
  if (::mkfifo(path.c_str(), 0600) != 0) throw std::system_error(errno, std::generic_category(), path);
}

}  // namespace zal::testing
