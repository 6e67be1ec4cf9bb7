#include "platform/linux/bus/linux_bus_services.h"

namespace zal {

LinuxBusServices::LinuxBusServices(const BusHost& host)
    : _host(host),
      _systemBus(_host, _host.systemBus, "system bus"),
      _sessionBus(_host, _host.sessionBus, "session bus"),
      _telephony(_host, _systemBus) {}

}  // namespace zal
