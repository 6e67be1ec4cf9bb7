#pragma once

#include <optional>
#include <string>

namespace zal {

class DeviceRegistry;

/// The device's model as people name it, or nothing when the host has none or none that is text.
/// Main thread only.
[[nodiscard]] std::optional<std::string> deviceModel(DeviceRegistry& registry);

}  // namespace zal
