#pragma once

#include <string>
#include <string_view>

#include "platform/linux/config/host_environment.h"

namespace zal {

// Where the buses of this host are, as D-Bus addresses, by the rules that every bus client follows:
// the D-Bus standard, "Well-known Message Bus Instances".

/// $DBUS_SYSTEM_BUS_ADDRESS, else the socket in /run/dbus.
[[nodiscard]] std::string systemBusAddress(const HostEnvironment& environment);
/// $DBUS_SESSION_BUS_ADDRESS, else the socket in $XDG_RUNTIME_DIR; empty when there is neither.
[[nodiscard]] std::string sessionBusAddress(const HostEnvironment& environment);
/// The module's shared object: beside the program, as a build leaves it, else where it is installed.
[[nodiscard]] std::string busModulePath(const HostEnvironment& environment);
/// Whether a bus may be found there: a socket file that does not exist says no. Costs one look.
[[nodiscard]] bool mayBeThere(std::string_view address);

}  // namespace zal
