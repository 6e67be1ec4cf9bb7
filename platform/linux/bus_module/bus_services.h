#pragma once

#include <memory>

#include "platform/linux/alerts/alert_screen.h"
#include "platform/linux/bus_module/bus_door.h"
#include "platform/linux/bus_module/bus_host.h"
#include "platform/linux/bus_module/bus_notifications.h"
#include "platform/linux/bus_module/cellular_data_status.h"
#include "platform/network_status.h"
#include "platform/telephony.h"

namespace zal {

/// The host services that are reached over D-Bus, as the module offers them. Made and ended on the
/// main thread; nothing is connected before the first use.
class BusServices {
 public:
  virtual ~BusServices() = default;
  [[nodiscard]] virtual Telephony& telephony() = 0;
  [[nodiscard]] virtual NetworkStatus& networkStatus() = 0;
  [[nodiscard]] virtual BusNotifications& notifications() = 0;
  [[nodiscard]] virtual BusDoor& door() = 0;
  [[nodiscard]] virtual AlertScreen& alertScreen() = 0;
  [[nodiscard]] virtual CellularDataStatus& cellularData() = 0;
};

/// What the module's one symbol, `lirraMakeBusServices`, is. Never empty; throws nothing but
/// std::bad_alloc.
using MakeBusServices = BusServices*(const BusHost& host);
inline constexpr const char* kMakeBusServices = "lirraMakeBusServices";

}  // namespace zal
