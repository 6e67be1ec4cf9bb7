#pragma once

#include <memory>
#include <utility>

#include "platform/linux/bus_module/bus_module.h"
#include "platform/network_status.h"
#include "platform/telephony.h"

namespace zal {

// The platform's services that the module answers; where it does not, they are as absent.

class OnDemandTelephony : public Telephony {
 public:
  explicit OnDemandTelephony(BusModule& module) : _module(module) {}
  [[nodiscard]] std::unique_ptr<TelephonyConnection> connect() override {
    BusServices* const services = _module.services();
    return services != nullptr ? services->telephony().connect() : nullptr;
  }
  void sampleSignal(SignalHandler handler) override {
    BusServices* const services = _module.services();
    services != nullptr ? services->telephony().sampleSignal(std::move(handler)) : handler(std::nullopt);
  }

 private:
  BusModule& _module;
};

class OnDemandNetworkStatus : public NetworkStatus {
 public:
  explicit OnDemandNetworkStatus(BusModule& module) : _module(module) {}
  void sampleWifi(WifiHandler handler) override {
    BusServices* const services = _module.services();
    services != nullptr ? services->networkStatus().sampleWifi(std::move(handler)) : handler(WifiSignal{});
  }

 private:
  BusModule& _module;
};

}  // namespace zal
