#pragma once

#include "platform/linux/bus/alerts/notification_screen.h"
#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/door/named_door.h"
#include "platform/linux/bus/network/bus_cellular_data.h"
#include "platform/linux/bus/network/bus_network_status.h"
#include "platform/linux/bus/notifications/signal_notifications.h"
#include "platform/linux/bus/telephony/bus_telephony.h"
#include "platform/linux/bus_module/bus_services.h"

namespace zal {

/// The module's services, each made once, on the connections that they share. Main thread.
class LinuxBusServices : public BusServices {
 public:
  explicit LinuxBusServices(const BusHost& host);
  [[nodiscard]] Telephony& telephony() override { return _telephony; }
  [[nodiscard]] NetworkStatus& networkStatus() override { return _networkStatus; }
  [[nodiscard]] BusNotifications& notifications() override { return _notifications; }
  [[nodiscard]] BusDoor& door() override { return _door; }
  [[nodiscard]] AlertScreen& alertScreen() override { return _alertScreen; }
  [[nodiscard]] CellularDataStatus& cellularData() override { return _cellularData; }

 private:
  const BusHost _host;
  BusConnection _systemBus;
  BusConnection _sessionBus;
  BusTelephony _telephony;
  BusNetworkStatus _networkStatus;
  BusCellularData _cellularData;
  SignalNotifications _notifications;
  NamedDoor _door;
  NotificationScreen _alertScreen{_host, _sessionBus};
};

}  // namespace zal
