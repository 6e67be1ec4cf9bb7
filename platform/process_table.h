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

/// A process that has a file open for writing.
struct FileWriter {
  pid_t processId = 0;
  std::string command;  ///< its arguments, joined by blanks; the short name where it has none
  std::string file;
  bool operator==(const FileWriter&) const = default;
};

/// The kernel's process table. Any thread.
class ProcessTable {
 public:
  virtual ~ProcessTable() = default;
  /// All processes of this moment, or nothing when the table cannot be read.
  [[nodiscard]] virtual std::optional<std::vector<ProcessEntry>> processes() const = 0;
  /// Other processes whose standard output or error is a file below the directory (absolute, without
  /// links), in order of their ids. Those of other users are seen only by the superuser.
  [[nodiscard]] virtual std::vector<FileWriter> writersBelow(const std::string& directory) const = 0;
};

}  // namespace zal
