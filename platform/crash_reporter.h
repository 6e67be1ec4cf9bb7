#pragma once

#include <sys/types.h>

#include <cstdint>
#include <string_view>

namespace zal {

/// The host's crash service. Any thread. Nothing here stops a process; a host without the service
/// answers false to everything.
class CrashReporter {
 public:
  virtual ~CrashReporter() = default;
  /// A report of a process as if it had crashed with that code. Returned: whether it was made.
  virtual bool simulateCrash(pid_t process, std::uint32_t exceptionCode, std::string_view message) = 0;
  /// A report of an exception that this process survived.
  virtual bool simulateCrashForException(std::string_view description) = 0;
  /// The stacks of every thread of the machine, with the reason and the code in the report.
  virtual bool stackshot(std::string_view reason, std::uint32_t code) = 0;
};

}  // namespace zal
