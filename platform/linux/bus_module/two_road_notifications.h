#pragma once

#include <deque>
#include <functional>
#include <string>
#include <string_view>

#include "platform/linux/bus_module/bus_module.h"
#include "platform/linux/notifications/post_copies.h"
#include "platform/linux/notifications/runtime_directory_notifications.h"
#include "platform/system_notifications.h"

namespace zal {

/// Notifications by the runtime directory and, where there is a bus, by its signals too: a post goes
/// both ways under one id, and is delivered once, by the first copy that arrives. Others may use one
/// road alone. Without a bus the directory goes on alone. Main thread only.
class TwoRoadNotifications : public SystemNotifications {
 public:
  /// Both outlive this. The bus is used as soon as somebody has the module loaded.
  TwoRoadNotifications(RuntimeDirectoryNotifications& directory, BusModule& bus);

  void observe(std::string name, std::function<void()> handler) override;
  void post(std::string_view name) override;

 private:
  struct Observer {
    std::string name;
    std::function<void()> handler;
  };
  void _useBus(BusServices& services);
  void _arrived(std::string_view name, std::string_view id, PostRoad road);

  RuntimeDirectoryNotifications& _directory;
  BusModule& _bus;
  std::deque<Observer> _observers;  // a deque: a handler may add another while it runs
  PostCopies _copies;
};

}  // namespace zal
