#include "platform/linux/host_identity/linux_device_registry.h"

#include <utility>

#include "platform/linux/config/text_file.h"

namespace zal {

LinuxDeviceRegistry::LinuxDeviceRegistry(std::string root) : _root(std::move(root)) {}

std::optional<std::string> LinuxDeviceRegistry::modelBytes() {
  _mainThread.check("LinuxDeviceRegistry");
  std::string bytes;
  for (const char* path : {"/proc/device-tree/model", "/sys/firmware/devicetree/base/model"}) {
    if (!readTextFile(_root + path, bytes) && !bytes.empty()) return bytes;
  }
  if (readTextFile(_root + "/sys/class/dmi/id/product_name", bytes)) return std::nullopt;
  if (bytes.ends_with('\n')) bytes.pop_back();  // the kernel adds it; it is no part of the name
  if (bytes.empty()) return std::nullopt;
  return bytes;
}

}  // namespace zal
