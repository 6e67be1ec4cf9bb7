#pragma once

#include <string>

#include "platform/device_registry.h"
#include "platform/main_thread_check.h"

namespace zal {

/// The system's identity from a configured property list (XML: a dictionary of strings), which then
/// is the only source; a broken or missing one reads as nothing. Without a configured one: the name
/// and version of os-release, and its BUILD_ID or else the kernel's release. Main thread only.
class LinuxSystemVersion : public SystemVersion {
 public:
  /// An empty path stands for "not configured". os-release is looked for below the root directory;
  /// another than "/" is for tests.
  explicit LinuxSystemVersion(std::string propertyList, std::string root = "/");
  [[nodiscard]] std::optional<std::map<std::string, std::string>> read() override;

 private:
  MainThreadCheck _mainThread;
  const std::string _propertyList;
  const std::string _root;
};

}  // namespace zal
