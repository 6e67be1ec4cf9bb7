#pragma once

#include <memory>
#include <set>
#include <string>

#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus_module/bus_notifications.h"

namespace zal {

/// Notifications as signals on one bus. Main thread only.
class SignalNotifications : public BusNotifications {
 public:
  /// The connection outlives this.
  explicit SignalNotifications(BusConnection& connection) : _connection(connection) {}

  void open(Handler onPost) override;
  void observe(const std::string& name) override;
  bool post(std::string_view name, std::string_view id) override;

 private:
  void _hear(sdbus::Message& signal) const;

  BusConnection& _connection;
  Handler _onPost;
  std::set<std::string, std::less<>> _observed;
  std::unique_ptr<sdbus::IObject> _object;  // what signals come from; none while there is no bus
  std::unique_ptr<BusConnection::User> _user;
};

/// Whether a signal can have the name: a D-Bus member name.
[[nodiscard]] bool isMemberName(std::string_view name);

}  // namespace zal
