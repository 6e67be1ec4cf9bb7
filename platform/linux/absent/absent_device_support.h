#pragma once

#include "platform/device_support.h"

namespace zal {

/// For a host without a video-call stack: no name, no calls over cellular. Any thread.
class AbsentDeviceSupport : public DeviceSupport {
 public:
  [[nodiscard]] std::string deviceName() override { return {}; }
  [[nodiscard]] bool videoCallsOverCellularAvailable() override { return false; }
};

}  // namespace zal
