#pragma once

#include <atomic>
#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include <asio/io_context.hpp>

#include "platform/agent_log.h"
#include "platform/crash_reporter.h"

namespace zal {

/// Reports by a helper program, which can stop our threads like anybody's and whose end we survive. Each
/// request starts one and returns: the report appears in its directory a moment later, whole. The file
/// names are the helper's (docs/host-tools.md). True means that the helper started; what became of the
/// report is a line of the log. Any thread.
class LinuxCrashReporter : public CrashReporter {
 public:
  /// Those that are running do not wait for each other, but the machine has other things to do.
  static constexpr int kMostAtOnce = 3;
  /// An exception's reporter comes at the end of the process: without us there were no stacks to read.
  static constexpr std::chrono::milliseconds kExceptionPatience{2000};

  struct Places {
    std::string helper;           ///< the program's file
    std::string reportDirectory;  ///< where the reports go; made when there is none
  };

  /// The loop, borrowed, buries the helpers; nothing else runs there.
  LinuxCrashReporter(asio::io_context& loop, AgentLog& log, Places places);

  bool simulateCrash(pid_t process, std::uint32_t exceptionCode, std::string_view message) override;
  /// Waits for the report, `kExceptionPatience` at most.
  bool simulateCrashForException(std::string_view description) override;
  bool stackshot(std::string_view reason, std::uint32_t code) override;

 private:
  bool _start(const std::string& what, std::vector<std::string> arguments,
              std::chrono::milliseconds patience = std::chrono::milliseconds{0});

  asio::io_context& _loop;
  AgentLog& _log;
  const Places _places;
  const std::shared_ptr<std::atomic<int>> _running = std::make_shared<std::atomic<int>>(0);
};

}  // namespace zal
