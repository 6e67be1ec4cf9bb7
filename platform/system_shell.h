#pragma once

#include <string>

namespace zal {

/// The system shell. Any thread; waits for the shell (not for what it started in the background).
class SystemShell {
 public:
  virtual ~SystemShell() = default;
  /// Runs `/bin/sh -c commandLine` with standard input from the null device, default signal
  /// dispositions and none of our descriptors above 2. Returned: the wait status as POSIX wait()
  /// gives it, or -1 when no shell could be started (logged).
  virtual int PerformSystem(const std::string& commandLine) = 0;
  /// The same for a line that ends with "&" and whose outcome nobody looks at. It may start a moment
  /// after the call, but such lines of one thread start in the order given.
  virtual void performSystemInBackground(const std::string& commandLine) { PerformSystem(commandLine); }
};

}  // namespace zal
