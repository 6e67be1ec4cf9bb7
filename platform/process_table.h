#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

namespace zal {

struct ProcessEntry {
  pid_t processId = 0;
  std::string shortName;  ///< the kernel's command name, at most 15 bytes on Linux (TASK_COMM_LEN)
};

/// The kernel's process table. Any thread.
class ProcessTable {
 public:
  virtual ~ProcessTable() = default;
  /// All processes of this moment, or nothing when the table cannot be read.
  [[nodiscard]] virtual std::optional<std::vector<ProcessEntry>> processes() const = 0;
};

}  // namespace zal
