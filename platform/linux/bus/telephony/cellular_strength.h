#pragma once

#include <optional>

#include "platform/telephony.h"

namespace zal {

/// The three numbers of a signal, from what modem daemons tell: the strength in percent (taken as 0 to
/// 100) and, where the modem measures it, the power received in dBm. Without that, or with one that no
/// radio receives, it is what the percentage stands for on the scale of AT modems: 31 steps of 2 dBm
/// above -113.
[[nodiscard]] CellularSignal cellularSignal(int percentage, std::optional<double> rssi = std::nullopt);
/// 0 to 4 bars; the second one comes above 30 percent.
[[nodiscard]] int gradedStrength(int percentage);

}  // namespace zal
