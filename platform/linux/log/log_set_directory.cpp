#include "platform/linux/log/log_set_directory.h"

#include <fcntl.h>

#include <filesystem>

#include "platform/linux/files/beneath.h"

namespace zal {

Descriptor openLogSet(const std::string& root, const std::string& set) {
  const Descriptor opened(::open(root.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  return opened.isOpen() ? openDirectoryBeneath(opened.get(), set) : Descriptor();
}

Descriptor openLogSet(const std::string& directory) {
  const std::filesystem::path path(directory);
  return openLogSet(path.parent_path().string(), path.filename().string());
}

}  // namespace zal
