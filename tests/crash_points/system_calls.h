#pragma once

#include <linux/filter.h>

#include <string>
#include <vector>

namespace zal::testing {

/// One system call that is watched.
struct WatchedCall {
  int number;
  const char* name;
  std::vector<int> errors;     ///< what it is made to fail with, where faults are injected
  bool onlyIfItMakes = false;  ///< only an open that may make or empty a file
  bool ofFilesOnly = false;    ///< its first argument has to be a file or directory for that
  bool writes = false;         ///< descriptor, bytes and their number are its first three arguments
};

/// All that changes what is on the disk or tells somebody: between two of them a kill finds one state.
[[nodiscard]] const std::vector<WatchedCall>& callsThatChange();
/// All that takes something from the host and may be refused.
[[nodiscard]] const std::vector<WatchedCall>& callsThatMayFail();

[[nodiscard]] const WatchedCall* findCall(const std::vector<WatchedCall>& calls, int number);
/// A filter that has a listener asked about these calls and lets all others pass.
[[nodiscard]] std::vector<sock_filter> filterFor(const std::vector<WatchedCall>& calls);

}  // namespace zal::testing
