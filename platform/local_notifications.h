#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <string_view>

namespace zal {

/// Notifications by name within this process. Main thread only; delivery is synchronous, inside
/// post(), in the order of observing.
///
///     auto id = notifications.observe("SessionEnded", [](void* session) { ... });
///     notifications.post("SessionEnded", this);
///     notifications.removeObserver(id);
class LocalNotifications {
 public:
  using ObserverId = std::uint64_t;
  /// The object is whatever the poster posts; observer and poster agree on its type by the name.
  using Handler = std::function<void(void* object)>;

  ObserverId observe(std::string name, Handler handler);
  void removeObserver(ObserverId observer);
  /// Observers that are added while it runs are not called; removed ones are not called any more.
  void post(std::string_view name, void* object);

 private:
  struct Observer {
    std::string name;
    Handler handler;
  };
  std::map<ObserverId, Observer> _observers;
  ObserverId _lastId = 0;
};

}  // namespace zal
