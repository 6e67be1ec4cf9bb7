#pragma once

#include "platform/radio_coexistence.h"

namespace zal {

/// For a host without such a manager. Any thread.
class AbsentRadioCoexistence : public RadioCoexistence {
 public:
  [[nodiscard]] std::function<void()> logDumpEntryPoint() override { return {}; }
};

}  // namespace zal
