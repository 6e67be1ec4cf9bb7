#pragma once

#include <functional>
#include <optional>
#include <string>

#include "platform/device_registry.h"

namespace zal {

/// Identity of the software and the device, kept for the life of the process. The entry makes one
/// and lends it to every session. Main thread only.
class BuildInformationCache {
 public:
  /// Fills each slot that is still absent, but only while the OS name or version is. A model that
  /// could not be had at a fill that brought both therefore stays absent.
  void refill(SystemVersion& systemVersion, const std::function<std::optional<std::string>()>& model);

  [[nodiscard]] const std::optional<std::string>& buildVersion() const { return _buildVersion; }
  [[nodiscard]] const std::optional<std::string>& osVersion() const { return _osVersion; }
  [[nodiscard]] const std::optional<std::string>& osName() const { return _osName; }
  [[nodiscard]] const std::optional<std::string>& deviceModel() const { return _deviceModel; }

 private:
  std::optional<std::string> _buildVersion, _osVersion, _osName, _deviceModel;
};

}  // namespace zal
