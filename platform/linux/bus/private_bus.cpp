#include "platform/linux/bus/private_bus.h"

namespace zal {

std::unique_ptr<sdbus::IConnection> openPrivateBus(const std::string& address) {
  try {
    auto bus = sdbus::createSessionBusConnectionWithAddress(address);
    bus->setMethodCallTimeout(kAnswerLimit);
    return bus;
  } catch (const sdbus::Error&) {
    return nullptr;
  }
}

bool hasOwner(sdbus::IConnection& bus, const std::string& serviceName) {
  try {
    bool isOwned = false;
    sdbus::createProxy(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus")
        ->callMethod("NameHasOwner")
        .onInterface("org.freedesktop.DBus")
        .withTimeout(kAnswerLimit)
        .withArguments(serviceName)
        .storeResultsTo(isOwned);
    return isOwned;
  } catch (const sdbus::Error&) {
    return false;
  }
}

}  // namespace zal
