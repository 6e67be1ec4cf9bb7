#pragma once

#include "platform/telephony.h"

namespace zal {

/// For a host without a telephony service: nobody can connect. Any thread.
class AbsentTelephony : public Telephony {
 public:
  [[nodiscard]] std::unique_ptr<TelephonyConnection> connect() override { return nullptr; }
  void sampleSignal(SignalHandler handler) override { handler(std::nullopt); }
};

}  // namespace zal
