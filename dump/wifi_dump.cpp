#include "dump/wifi_dump.h"

#include <memory>

#include "dump/collection_record.h"
#include "platform/main_thread_watch.h"
#include "platform/platform.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

/// Held by the completion too, which may come when nobody waits any more.
struct Outcome {
  std::binary_semaphore signal{0};
  int result = 0;
};

}  // namespace

bool waitInSteadyTime(std::binary_semaphore& signal, std::chrono::seconds limit) {
  const MainThreadWatch::WantedWait wait;
  return signal.try_acquire_for(limit);
}

void takeWifiDump(Platform& platform, const std::string& service, const std::optional<std::string>& reason,
                  const SignalWait& wait, CollectionRecord& record) {
  const std::string& root = platform.configuration.roots.SystemReportRoot;
  const std::string directory = standardizeBelowRoot(root + "/WiFi", root, platform.files.homeDirectory());
  // The service would follow a link there.
  if (const std::error_code error = platform.files.makeDirectories(directory)) {
    platform.agentLog.warning("No Wi-Fi dump is taken into " + directory + ": " + error.message());
    return record.stepGives(PartState::failed, error.message());
  }
  const auto outcome = std::make_shared<Outcome>();
  platform.wifiDiagnostics.takeDump(directory, reason.value_or("WiFi log dump for service: " + service),
                                    [outcome, &log = platform.agentLog](int result) {
                                      log.warning("Wifi dump log result: " + std::to_string(result));
                                      outcome->result = result;
                                      outcome->signal.release();
                                    });
  if (!wait(outcome->signal, kWifiDiagnosticsLimit)) {
    platform.agentLog.warning("Timed out while waiting for wifi logs dump to complete");
    record.stepGives(PartState::failed, "not complete in time");
  } else if (outcome->result != 0) {
    record.stepGives(PartState::failed, "the service answered " + std::to_string(outcome->result));
  }
}

}  // namespace zal
