#include "tests/e2e/small_disk.h"

#include <sys/mount.h>
#include <sys/statvfs.h>

#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <utility>

namespace zal::testing {

SmallDisk::SmallDisk(std::string directory, const std::string& size) : _directory(std::move(directory)) {
  std::filesystem::create_directories(_directory);
  if (::mount("tmpfs", _directory.c_str(), "tmpfs", 0, ("size=" + size).c_str()) != 0) _error = errno;
}

SmallDisk::~SmallDisk() {
  if (_error == 0) ::umount2(_directory.c_str(), MNT_DETACH);
}

void SmallDisk::fill(std::size_t bytesLeft) const {
  {
    std::ofstream ballast(_directory + "/ballast", std::ios::binary);
    const std::string block(4096, 'x');
    while (ballast.write(block.data(), static_cast<std::streamsize>(block.size())).flush()) {
    }
  }
  const auto size = std::filesystem::file_size(_directory + "/ballast");
  std::filesystem::resize_file(_directory + "/ballast", size > bytesLeft ? size - bytesLeft : 0);
}

void SmallDisk::leaveFree(std::size_t bytes) const {
  struct statvfs status {};
  if (::statvfs(_directory.c_str(), &status) != 0) throw std::runtime_error("no statvfs");
  const std::size_t used = (status.f_blocks - status.f_bfree) * status.f_frsize;
  const std::string size = "size=" + std::to_string(used + bytes);
  if (::mount("tmpfs", _directory.c_str(), "tmpfs", MS_REMOUNT, size.c_str()) != 0)
    throw std::runtime_error("no other size");
}

void SmallDisk::makeRoom() const { std::filesystem::remove(_directory + "/ballast"); }

}  // namespace zal::testing
