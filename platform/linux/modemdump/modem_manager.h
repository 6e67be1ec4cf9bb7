#pragma once

namespace zal::modemdump {

inline constexpr const char* kModemManager = "org.freedesktop.ModemManager1";
inline constexpr const char* kModemManagerPath = "/org/freedesktop/ModemManager1";

}  // namespace zal::modemdump
