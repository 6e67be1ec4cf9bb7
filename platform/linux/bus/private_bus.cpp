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
  return ownerOf(bus, serviceName).has_value();
}

std::optional<std::string> ownerOf(sdbus::IConnection& bus, const std::string& serviceName) {
  try {
    std::string owner;
    sdbus::createProxy(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus")
        ->callMethod("GetNameOwner")
        .onInterface("org.freedesktop.DBus")
        .withTimeout(kAnswerLimit)
        .withArguments(serviceName)
        .storeResultsTo(owner);
    return owner;
  } catch (const sdbus::Error&) {
    return std::nullopt;
  }
}

}  // namespace zal
