#pragma once

#include <functional>
#include <string>
#include <string_view>

namespace zal {

/// Notifications by name between all processes of the host. Main thread only.
class SystemNotifications {
 public:
  virtual ~SystemNotifications() = default;
  /// From now on the handler runs on the main thread, once per post that the host did not fold into
  /// an undelivered one, for as long as the service lives.
  virtual void observe(std::string name, std::function<void()> handler) = 0;
  /// Tells every observer on the host, this process included. Failure is logged.
  virtual void post(std::string_view name) = 0;
};

}  // namespace zal
