#include "platform/linux/bus/linux_bus_services.h"

// The module's one symbol: see MakeBusServices.
extern "C" __attribute__((visibility("default"))) zal::BusServices* lirraMakeBusServices(
    const zal::BusHost& host) {
  return new zal::LinuxBusServices(host);
}
