#include "session/signal_metrics.h"

#include <cstdint>

namespace zal {

namespace {

void addCellular(Telephony& telephony, SignalMetricsSnapshot& snapshot) {
  const auto connection = telephony.connect();
  if (!connection) return;
  const auto signal = connection->signalStrength();
  if (!signal) return;
  snapshot["cell-signal-rssi"] = std::int64_t{signal->rssi};
  snapshot["cell-signal-percentage"] = std::int64_t{signal->percentage};
  snapshot["cell-signal-graded"] = std::int64_t{signal->graded};
}

void addWifi(NetworkStatus& networkStatus, SignalMetricsSnapshot& snapshot) {
  constexpr const char* kRssi = "wifi-signal-rssi";
  constexpr const char* kStrength = "wifi-signal-strength";
  constexpr const char* kRate = "wifi-signal-rate";
  if (!networkStatus.isWifiAssociated()) {
    for (const char* key : {kRssi, kStrength, kRate}) snapshot[key] = std::uint64_t{0};
    return;
  }
  if (const auto rssi = networkStatus.scaledRssi()) snapshot[kRssi] = *rssi;
  if (const auto strength = networkStatus.signalStrength()) snapshot[kStrength] = *strength;
  if (const auto rate = networkStatus.scaledRate()) snapshot[kRate] = *rate;
}

}  // namespace

SignalMetricsSnapshot signalMetricsSnapshot(Telephony& telephony, NetworkStatus& networkStatus) {
  SignalMetricsSnapshot snapshot;
  addCellular(telephony, snapshot);
  addWifi(networkStatus, snapshot);
  return snapshot;
}

}  // namespace zal
