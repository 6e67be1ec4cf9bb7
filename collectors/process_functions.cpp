#include "collectors/process_functions.h"

#include <cstring>

#include "platform/crash_reporter.h"
#include "platform/process_table.h"

namespace zal {

pid_t ProcessIdForName(const ProcessTable& processes, const std::string& name) {
  constexpr std::size_t kComparedBytes = 16;
  if (name.empty()) return -1;
  const auto table = processes.processes();
  if (!table) return -1;
  for (const auto& process : *table) {
    if (process.processId < 1) continue;
    if (std::strncmp(process.shortName.c_str(), name.c_str(), kComparedBytes) == 0) return process.processId;
  }
  return -1;
}

void SimulateCrashForProcess(const ProcessTable& processes, CrashReporter& reporter, const std::string& name,
                             const std::optional<std::string>& reason) {
  const pid_t process = ProcessIdForName(processes, name);
  if (process == -1) return;
  reporter.simulateCrash(process, kSimulatedCrashCode,
                         "Simulating crash for " + name + " from Quarro Debug because [" +
                             reason.value_or("No Reason Given") + "].");
}

}  // namespace zal
