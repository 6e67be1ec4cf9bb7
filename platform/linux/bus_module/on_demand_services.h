#pragma once

#include <memory>
#include <utility>

#include "platform/linux/alerts/alert_screen.h"
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

/// Notifications on the person's screen. What they cannot ask is declined before anything is loaded.
class OnDemandAlertScreen : public AlertScreen {
 public:
  explicit OnDemandAlertScreen(BusModule& module) : _module(module) {}
  void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) override {
    BusServices* const services = alert.textField ? nullptr : _module.services();
    if (services == nullptr) {
      handlers.onDeclined();
      return;
    }
    _used = &services->alertScreen();
    _used->present(id, alert, std::move(handlers));
  }
  void withdraw(const std::string& id) override {
    if (_used != nullptr) _used->withdraw(id);
  }
  void agentEnds() override {
    if (_used != nullptr) _used->agentEnds();
  }

 private:
  BusModule& _module;
  AlertScreen* _used = nullptr;
};

class OnDemandCellularData : public CellularDataStatus {
 public:
  explicit OnDemandCellularData(BusModule& module) : _module(module) {}
  void ask(Handler handler) override {
    BusServices* const services = _module.services();
    services != nullptr ? services->cellularData().ask(std::move(handler)) : handler(CellularData::noService);
  }

 private:
  BusModule& _module;
};

}  // namespace zal
