#include "platform/linux/bus_module/bus_addresses.h"

#include <unistd.h>

namespace zal {
namespace {

constexpr std::string_view kSocketPath = "unix:path=";

}  // namespace

std::string systemBusAddress(const HostEnvironment& environment) {
  std::string address = environment.variable("DBUS_SYSTEM_BUS_ADDRESS");
  return address.empty() ? "unix:path=/run/dbus/system_bus_socket" : address;
}

std::string sessionBusAddress(const HostEnvironment& environment) {
  std::string address = environment.variable("DBUS_SESSION_BUS_ADDRESS");
  if (!address.empty()) return address;
  const std::string directory = environment.directoryVariable("XDG_RUNTIME_DIR");
  return directory.empty() ? "" : std::string(kSocketPath) + directory + "/bus";
}

std::string busModulePath(const HostEnvironment& environment) {
  std::string beside = environment.executableDirectory + "/lirra-bus.so";
  if (::access(beside.c_str(), F_OK) == 0) return beside;
  return environment.executableDirectory + "/../lib/lirra/lirra-bus.so";
}

bool mayBeThere(std::string_view address) {
  if (!address.starts_with(kSocketPath)) return !address.empty();
  address.remove_prefix(kSocketPath.size());
  // Escaped bytes and further addresses are for the bus library to read.
  if (address.find_first_of("%;") != std::string_view::npos) return true;
  return ::access(std::string(address.substr(0, address.find(','))).c_str(), F_OK) == 0;
}

}  // namespace zal
