#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "platform/linux/helper/patience.h"
#include "platform/linux/modemdump/bus_message.h"

namespace zal::modemdump {

/// Why something could not be had, in half a sentence.
struct Trouble {
  std::string text;
};

struct BusMethod {
  std::string service;
  std::string path;
  std::string interface;
  std::string member;
};

/// The system bus. Nothing here starts a service. Each call waits at most two seconds for its answer,
/// the first one's includes the bus's own greeting, and none waits longer than the patience.
class SystemBus {
 public:
  static constexpr std::chrono::milliseconds kCallLimit{2000};
  using Answer = std::variant<BusMessage, Trouble>;

  [[nodiscard]] static std::variant<SystemBus, Trouble> connect(helper::Patience& patience);
  /// Calls a method that takes these texts (most often none).
  [[nodiscard]] Answer call(const BusMethod& method, const std::vector<std::string>& texts = {});
  /// The same at the end of everything: waits although the patience is over, but only half a second.
  Answer callAtTheEnd(const BusMethod& method, const std::vector<std::string>& texts);
  /// False, too, when the bus does not say.
  [[nodiscard]] std::variant<bool, Trouble> hasOwner(const std::string& name);

 private:
  struct Close {
    void operator()(sd_bus* bus) const { sd_bus_close_unref(bus); }
  };
  using Bus = std::unique_ptr<sd_bus, Close>;

  SystemBus(Bus bus, helper::Patience& patience) : _bus(std::move(bus)), _patience(&patience) {}
  Answer _call(const BusMethod& method, const std::vector<std::string>& texts,
               std::chrono::milliseconds limit, helper::Patience* patience);

  Bus _bus;
  helper::Patience* _patience;
};

}  // namespace zal::modemdump
