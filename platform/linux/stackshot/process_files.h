#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/linux/stackshot/records.h"

namespace zal::stackshot {

// The process file system. Everything may vanish between two looks; nothing here waits for a process.

/// What a "stat" file says.
struct StatLine {
  std::string name;
  char state = '?';
  pid_t parent = 0;
  bool isKernel = false;
};
[[nodiscard]] std::optional<StatLine> parseStatLine(std::string_view text);

/// All process ids, ascending.
[[nodiscard]] std::vector<pid_t> allProcesses();
/// All thread ids of the process, ascending; empty when it is gone.
[[nodiscard]] std::vector<pid_t> threadsOf(pid_t process);
/// Without its threads. Nothing when there is no such process.
[[nodiscard]] std::optional<ProcessRecord> readProcess(pid_t process);
/// Without its stack. Nothing when the thread is gone.
[[nodiscard]] std::optional<ThreadRecord> readThread(pid_t process, pid_t thread);
/// The kernel's letter now; '?' when the thread is gone.
[[nodiscard]] char stateOf(pid_t process, pid_t thread);
/// The kernel's own stack, where this user may read it.
[[nodiscard]] std::vector<std::string> kernelFramesOf(pid_t process, pid_t thread);
/// Who traces the thread; 0 for nobody.
[[nodiscard]] pid_t tracerOf(pid_t process, pid_t thread);

}  // namespace zal::stackshot
