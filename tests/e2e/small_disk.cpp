#include "tests/e2e/small_disk.h"

#include <sys/mount.h>

#include <filesystem>
#include <fstream>
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

void SmallDisk::makeRoom() const { std::filesystem::remove(_directory + "/ballast"); }

}  // namespace zal::testing
