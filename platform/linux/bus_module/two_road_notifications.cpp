#include "platform/linux/bus_module/two_road_notifications.h"

#include <algorithm>
#include <utility>

namespace zal {

TwoRoadNotifications::TwoRoadNotifications(RuntimeDirectoryNotifications& directory, BusModule& bus)
    : _directory(directory), _bus(bus) {
  _bus.whenLoaded([this](BusServices& services) { _useBus(services); });
}

void TwoRoadNotifications::observe(std::string name, std::function<void()> handler) {
  const bool isNew = std::none_of(_observers.begin(), _observers.end(),
                                  [&](const Observer& observer) { return observer.name == name; });
  if (isNew) {
    _directory.observePosts(name,
                            [this, name](std::string_view id) { _arrived(name, id, PostRoad::directory); });
    if (BusServices* const services = _bus.loaded()) services->notifications().observe(name);
  }
  _observers.push_back({std::move(name), std::move(handler)});
}

void TwoRoadNotifications::post(std::string_view name) {
  const std::string id = newPostId();
  _directory.postWithId(name, id);
  if (BusServices* const services = _bus.loaded()) services->notifications().post(name, id);
}

void TwoRoadNotifications::_useBus(BusServices& services) {
  BusNotifications& notifications = services.notifications();
  notifications.open(
      [this](std::string_view name, std::string_view id) { _arrived(name, id, PostRoad::bus); });
  for (const Observer& observer : _observers) notifications.observe(observer.name);
}

void TwoRoadNotifications::_arrived(std::string_view name, std::string_view id, PostRoad road) {
  if (_copies.isCopy(id, road)) return;
  const std::size_t count = _observers.size();
  for (std::size_t i = 0; i < count; ++i) {
    if (_observers[i].name == name) _observers[i].handler();
  }
}

}  // namespace zal
