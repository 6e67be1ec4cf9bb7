#pragma once

#include <sys/types.h>

#include <chrono>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "platform/agent_log.h"
#include "platform/wifi_diagnostics.h"

namespace zal {

/// Wi-Fi diagnostics by `lirra-wifidump`, a child that is given less time than callers wait. A thread of
/// its own waits for its end, for the main thread may be the one that waits for the dump. Any thread.
///
/// One at a time: a dump that is asked for while one is taken ends with that one, since both would
/// fill the same directory with the same.
class LinuxWifiDiagnostics : public WifiDiagnostics {
 public:
  static constexpr int kNotAvailable = -1;  ///< the program cannot be started
  static constexpr int kCutOff = -2;        ///< it did not end in time
  static constexpr int kBroken = -3;        ///< it ended by a signal
  /// Less than the 15 seconds that a collection waits. The program itself ends at 12.
  static constexpr std::chrono::milliseconds kLimit{13500};
  /// The reason is cut there, in bytes: it becomes an argument.
  static constexpr std::size_t kLongestReason = 4096;

  /// The program's path. The log outlives this. The limit is for tests.
  LinuxWifiDiagnostics(AgentLog& log, std::string helper, std::chrono::milliseconds limit = kLimit);
  /// Tells a program that runs to end, and completes.
  ~LinuxWifiDiagnostics() override;
  LinuxWifiDiagnostics(const LinuxWifiDiagnostics&) = delete;
  LinuxWifiDiagnostics& operator=(const LinuxWifiDiagnostics&) = delete;

  /// Besides the numbers above the program's own: 1 when nothing was had, 3 when the directory cannot be
  /// written.
  void takeDump(const std::string& directory, const std::string& reason, Completion completion) override;

 private:
  [[nodiscard]] bool _startOne(const std::string& directory, const std::string& reason);
  void _awaitEnd(pid_t child);
  void _complete(int result);

  AgentLog& _log;
  const std::string _helper;
  const std::chrono::milliseconds _limit;
  std::mutex _lock;
  // Guarded by _lock from here on.
  std::vector<Completion> _waiting;
  bool _isTaken = false;
  pid_t _child = -1;  // -1: none runs, or its end is known
  std::thread _thread;
};

}  // namespace zal
