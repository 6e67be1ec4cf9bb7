#pragma once

namespace zal {

/// The end of the process. Main thread only.
class ProcessExit {
 public:
  virtual ~ProcessExit() = default;
  /// Asks for the end with that status. The real one does not return; a test's may, so callers
  /// return right after it.
  virtual void exit(int status) = 0;
};

}  // namespace zal
