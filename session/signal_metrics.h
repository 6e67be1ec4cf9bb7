#pragma once

#include <map>
#include <string>

#include "platform/network_status.h"
#include "platform/telephony.h"
#include "platform/value.h"

namespace zal {

/// Metric name to value. What the host cannot tell is left out; Wi-Fi that is not associated counts
/// as zeros.
using SignalMetricsSnapshot = std::map<std::string, Number>;

[[nodiscard]] SignalMetricsSnapshot signalMetricsSnapshot(Telephony& telephony, NetworkStatus& networkStatus);

}  // namespace zal
