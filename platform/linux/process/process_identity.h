#pragma once

#include <sys/types.h>

#include <cstdint>

namespace zal {

/// One process as a record names it: an id alone is given out again after its owner has ended.
struct ProcessIdentity {
  pid_t processId = 0;
  std::uint64_t startTime = 0;  ///< clock ticks from the host's start to the process's

  /// Any thread. Reads the process file system once for each call.
  [[nodiscard]] static ProcessIdentity ofThisProcess();
  /// Whether it still runs; a process that only waits to be buried does not. Any thread.
  [[nodiscard]] bool isRunning() const;
  bool operator==(const ProcessIdentity&) const = default;
};

}  // namespace zal
