#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <semaphore>
#include <string>

namespace zal {

class CollectionRecord;
struct Platform;

/// The Wi-Fi diagnostics dump gets this long, and its caller waits for it.
inline constexpr std::chrono::seconds kWifiDiagnosticsLimit{15};

/// Waits for the signal at most that long. Returned: whether it came.
using SignalWait = std::function<bool(std::binary_semaphore& signal, std::chrono::seconds limit)>;
bool waitInSteadyTime(std::binary_semaphore& signal, std::chrono::seconds limit);

/// Has the host's Wi-Fi diagnostics fill SystemReportRoot/WiFi and waits for it on the calling
/// thread. A dump that completes later is only logged.
void takeWifiDump(Platform& platform, const std::string& service, const std::optional<std::string>& reason,
                  const SignalWait& wait, CollectionRecord& record);

}  // namespace zal
