#pragma once

#include <sys/types.h>

#include <cstdint>

namespace zal::bench {

/// What the kernel says about a running process, all its threads together. Gone: zeros.
[[nodiscard]] double cpuSeconds(pid_t process);  ///< user and system, to the nanosecond
[[nodiscard]] double residentMebibytes(pid_t process);
[[nodiscard]] double peakMebibytes(pid_t process);          ///< the most that was ever resident
[[nodiscard]] double proportionalMebibytes(pid_t process);  ///< shared pages counted by share
[[nodiscard]] std::uint64_t contextSwitches(pid_t process);

}  // namespace zal::bench
