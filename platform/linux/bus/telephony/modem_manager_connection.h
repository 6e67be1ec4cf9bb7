#pragma once

#include <memory>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus_module/bus_host.h"
#include "platform/telephony.h"

namespace zal {

/// ModemManager as the telephony service, asked over a connection of the caller's own. `owner` is the
/// unique name of its process (ownerOf). All properties are read when the first question comes, of one
/// modem at one moment; what a daemon that hangs is asked does not add up (BusPeer).
[[nodiscard]] std::unique_ptr<TelephonyConnection> openModemManager(std::unique_ptr<sdbus::IConnection> bus,
                                                                    const std::string& owner,
                                                                    const BusHost& host);

}  // namespace zal
