#pragma once

#include <atomic>

#include "platform/agent_log.h"
#include "platform/crash_reporter.h"

namespace zal {

/// For a host without a crash service: no report is ever made, and the agent log says so once for
/// each kind of request. Any thread.
class AbsentCrashReporter : public CrashReporter {
 public:
  explicit AbsentCrashReporter(AgentLog& log) : _log(log) {}
  bool simulateCrash(pid_t process, std::uint32_t exceptionCode, std::string_view message) override;
  bool simulateCrashForException(std::string_view description) override;
  bool stackshot(std::string_view reason, std::uint32_t code) override;

 private:
  bool _refuse(std::atomic_flag& said, std::string_view what);

  AgentLog& _log;
  std::atomic_flag _saidProcess{}, _saidException{}, _saidStackshot{};
};

}  // namespace zal
