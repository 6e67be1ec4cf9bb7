#include "platform/linux/bus/linux_bus_services.h"

#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {

LinuxBusServices::LinuxBusServices(const BusHost& host)
    : _host(host),
      _systemBus(_host, _host.systemBus, "system bus"),
      _sessionBus(_host, _host.sessionBus, "session bus"),
      _telephony(_host, _systemBus),
      _networkStatus(_host, _systemBus),
      _cellularData(_host, _systemBus),
      _notifications(mayBeThere(_host.systemBus) ? _systemBus : _sessionBus),
      _door(_host, _host.isSystem ? _systemBus : _sessionBus, _host.isSystem ? "system bus" : "session bus") {
}

}  // namespace zal
