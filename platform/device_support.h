#pragma once

#include <string>

namespace zal {

/// What the video-call stack knows of the device. Any thread; never waits for a daemon.
class DeviceSupport {
 public:
  virtual ~DeviceSupport() = default;
  /// The name that the user gave the device; empty where there is none, or no such service.
  [[nodiscard]] virtual std::string deviceName() = 0;
  /// Whether video calls work without Wi-Fi; false where there is no such service.
  [[nodiscard]] virtual bool videoCallsOverCellularAvailable() = 0;
};

}  // namespace zal
