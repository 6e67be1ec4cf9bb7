#pragma once

#include <functional>
#include <map>
#include <string>

#include "platform/network_status.h"
#include "platform/telephony.h"
#include "platform/value.h"

namespace zal {

/// Metric name to value. What the host cannot tell, or not in time, is left out; Wi-Fi that is not
/// associated counts as zeros.
using SignalMetricsSnapshot = std::map<std::string, Number>;

using SignalMetricsHandler = std::function<void(const SignalMetricsSnapshot& snapshot)>;

/// Asks both services and waits for neither: the handler runs once on the main thread, perhaps inside
/// the call. The services outlive the answer. Main thread only.
void gatherSignalMetrics(Telephony& telephony, NetworkStatus& networkStatus, SignalMetricsHandler handler);

}  // namespace zal
