#include "session/signal_metrics.h"

#include <cstdint>
#include <utility>

namespace zal {

namespace {

void addCellular(const CellularSignal& signal, SignalMetricsSnapshot& snapshot) {
  snapshot["cell-signal-rssi"] = std::int64_t{signal.rssi};
  snapshot["cell-signal-percentage"] = std::int64_t{signal.percentage};
  snapshot["cell-signal-graded"] = std::int64_t{signal.graded};
}

void addWifi(const WifiSignal& signal, SignalMetricsSnapshot& snapshot) {
  constexpr const char* kRssi = "wifi-signal-rssi";
  constexpr const char* kStrength = "wifi-signal-strength";
  constexpr const char* kRate = "wifi-signal-rate";
  if (!signal.isAssociated) {
    for (const char* key : {kRssi, kStrength, kRate}) snapshot[key] = std::uint64_t{0};
    return;
  }
  if (signal.scaledRssi) snapshot[kRssi] = *signal.scaledRssi;
  if (signal.signalStrength) snapshot[kStrength] = *signal.signalStrength;
  if (signal.scaledRate) snapshot[kRate] = *signal.scaledRate;
}

}  // namespace

void gatherSignalMetrics(Telephony& telephony, NetworkStatus& networkStatus, SignalMetricsHandler handler) {
  telephony.sampleSignal(
      [&networkStatus, handler = std::move(handler)](const std::optional<CellularSignal>& cellular) mutable {
        SignalMetricsSnapshot snapshot;
        if (cellular) addCellular(*cellular, snapshot);
        networkStatus.sampleWifi([snapshot = std::move(snapshot), handler = std::move(handler)](
                                     const std::optional<WifiSignal>& wifi) mutable {
          if (wifi) addWifi(*wifi, snapshot);
          handler(snapshot);
        });
      });
}

}  // namespace zal
