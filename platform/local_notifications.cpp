#include "platform/local_notifications.h"

#include <vector>

namespace zal {

LocalNotifications::ObserverId LocalNotifications::observe(std::string name, Handler handler) {
  _observers.emplace(++_lastId, Observer{std::move(name), std::move(handler)});
  return _lastId;
}

void LocalNotifications::removeObserver(ObserverId observer) { _observers.erase(observer); }

void LocalNotifications::post(std::string_view name, void* object) {
  std::vector<ObserverId> due;
  for (const auto& [id, observer] : _observers) {
    if (observer.name == name) due.push_back(id);
  }
  for (const ObserverId id : due) {
    const auto found = _observers.find(id);
    if (found == _observers.end()) continue;
    const Handler handler = found->second.handler;  // the handler may remove itself
    handler(object);
  }
}

}  // namespace zal
