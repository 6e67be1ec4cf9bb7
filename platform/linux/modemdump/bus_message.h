#pragma once

#include <memory>

#include <systemd/sd-bus.h>

namespace zal::modemdump {

struct UnrefMessage {
  void operator()(sd_bus_message* message) const { sd_bus_message_unref(message); }
};
using BusMessage = std::unique_ptr<sd_bus_message, UnrefMessage>;

}  // namespace zal::modemdump
