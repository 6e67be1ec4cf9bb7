#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus_module/bus_host.h"
#include "platform/telephony.h"

namespace zal {

/// A question about the signal that is on its way. Its end takes it back: nothing of it is left on the
/// connection, and its handler does not run any more. It must not be ended by its own handler.
class SignalQuestion {
 public:
  virtual ~SignalQuestion() = default;
};

/// One kind of modem daemon. It is spoken to under the unique name of its process ("owner"), never
/// under its own: a call to a process that ended starts no other.
struct TelephonyDaemon {
  /// Called once, on the main thread, not inside ask(); nothing when there is no signal to be told.
  using SignalHandler = std::function<void(std::optional<CellularSignal> signal)>;
  struct Open {
    std::unique_ptr<sdbus::IConnection> bus;  ///< a private one, for calls that wait
    std::string owner;
    const BusHost& host;
  };

  std::string_view name;   ///< well-known, on the system bus
  std::string_view title;  ///< as the log calls it
  /// On a thread that may wait. Asks nothing yet, or little; never null.
  std::unique_ptr<TelephonyConnection> (*open)(Open where);
  /// On the main thread, with calls that do not wait, of at most 500 ms each.
  std::unique_ptr<SignalQuestion> (*askSignal)(sdbus::IConnection& bus, const std::string& owner,
                                               SignalHandler handler);
};

}  // namespace zal
