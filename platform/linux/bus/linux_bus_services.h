#pragma once

#include "platform/linux/absent/absent_network_status.h"
#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/telephony/bus_telephony.h"
#include "platform/linux/bus_module/bus_services.h"

namespace zal {

/// The module's services, each made once, on the connections that they share. Main thread.
class LinuxBusServices : public BusServices {
 public:
  explicit LinuxBusServices(const BusHost& host);
  [[nodiscard]] Telephony& telephony() override { return _telephony; }
  [[nodiscard]] NetworkStatus& networkStatus() override { return _networkStatus; }

 private:
  const BusHost _host;
  BusConnection _systemBus;
  BusConnection _sessionBus;
  BusTelephony _telephony;
  AbsentNetworkStatus _networkStatus;
};

}  // namespace zal
