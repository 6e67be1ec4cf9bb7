#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>

namespace zal {

class CrashReporter;
class ProcessTable;

/// What a crash report shows as the reason when nothing crashed and somebody asked for it.
inline constexpr std::uint32_t kSimulatedCrashCode = 0xFED9E2FF;

/// The first process whose short name equals the name in its first 16 bytes, or -1: so a longer name
/// means the process that the kernel calls by those 16. An empty name reads nothing. Any thread.
[[nodiscard]] pid_t ProcessIdForName(const ProcessTable& processes, const std::string& name);

/// Asks the crash service for a report of that process, which goes on running. Does nothing when
/// there is no such process. Any thread.
void SimulateCrashForProcess(const ProcessTable& processes, CrashReporter& reporter, const std::string& name,
                             const std::optional<std::string>& reason);

}  // namespace zal
