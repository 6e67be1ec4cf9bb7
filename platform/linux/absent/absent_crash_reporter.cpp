#include "platform/linux/absent/absent_crash_reporter.h"

#include <string>

namespace zal {

bool AbsentCrashReporter::simulateCrash(pid_t /*process*/, std::uint32_t /*exceptionCode*/,
                                        std::string_view /*message*/) {
  return _refuse(_saidProcess, "crash reports of processes");
}

bool AbsentCrashReporter::simulateCrashForException(std::string_view /*description*/) {
  return _refuse(_saidException, "crash reports of exceptions");
}

bool AbsentCrashReporter::stackshot(std::string_view /*reason*/, std::uint32_t /*code*/) {
  return _refuse(_saidStackshot, "stackshots");
}

bool AbsentCrashReporter::_refuse(std::atomic_flag& said, std::string_view what) {
  if (!said.test_and_set()) {
    _log.notice("This host has no crash service: " + std::string(what) + " are not made");
  }
  return false;
}

}  // namespace zal
