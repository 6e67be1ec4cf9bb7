#pragma once

#include <functional>
#include <string>
#include <string_view>

namespace zal {

/// The bus's share of the system-wide notifications: signals of the interface com.vendel.Lirra from the
/// object /com/vendel/lirra, whoever sends them, each named by its notification. Main thread only.
class BusNotifications {
 public:
  /// `id` is empty for a post without one.
  using Handler = std::function<void(std::string_view name, std::string_view id)>;

  virtual ~BusNotifications() = default;
  /// Wants the bus from now on, and hears what is observed. Once.
  virtual void open(Handler onPost) = 0;
  /// Has the handler called for posts of that name, also after the bus was gone.
  virtual void observe(const std::string& name) = 0;
  /// Returned: whether the bus took it. It has none now, or the name is none that a signal can have.
  virtual bool post(std::string_view name, std::string_view id) = 0;
};

}  // namespace zal
