#pragma once

#include <string>

#include "platform/device_registry.h"
#include "platform/main_thread_check.h"

namespace zal {

/// The model as the firmware names it: the device tree's "model" property with its NUL, else the DMI
/// product name, else nothing. Main thread only.
class LinuxDeviceRegistry : public DeviceRegistry {
 public:
  /// Looks below the root directory for "proc" and "sys"; another than "/" is for tests.
  explicit LinuxDeviceRegistry(std::string root = "/");
  [[nodiscard]] std::optional<std::string> modelBytes() override;

 private:
  MainThreadCheck _mainThread;
  const std::string _root;
};

}  // namespace zal
