#pragma once

#include <map>
#include <optional>
#include <string>

namespace zal {

/// What the host knows of the device itself. Main thread only.
class DeviceRegistry {
 public:
  virtual ~DeviceRegistry() = default;
  /// The platform root device's "model" property, raw: bytes up to and maybe beyond a NUL. Nothing
  /// when the host has no such device or property.
  [[nodiscard]] virtual std::optional<std::string> modelBytes() = 0;
};

/// The operating system's identity. Main thread only.
class SystemVersion {
 public:
  virtual ~SystemVersion() = default;
  /// Reads it afresh: "ProductBuildVersion", "ProductVersion", "ProductName", as far as present.
  /// Nothing when it cannot be read.
  [[nodiscard]] virtual std::optional<std::map<std::string, std::string>> read() = 0;
};

}  // namespace zal
