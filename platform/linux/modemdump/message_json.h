#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/linux/modemdump/bus_message.h"

namespace zal::modemdump {

/// The message's values from where it is read next to its end, as JSON, indented and with a newline at
/// its end: a lone value stands by itself, several are an array. Dictionaries are objects, structures
/// arrays, variants what they hold, descriptors null. Nothing for a message that cannot be read.
[[nodiscard]] std::optional<std::string> messageJson(sd_bus_message* message);

/// The text in quotes, all that JSON asks for escaped.
[[nodiscard]] std::string jsonText(std::string_view text);

}  // namespace zal::modemdump
