#pragma once

#include <functional>
#include <mutex>
#include <vector>

#include "platform/agent_log.h"

namespace zal {

/// The log files of one ended session, written once by whoever comes first. Any thread.
class SessionLogWriting {
 public:
  /// Writes one file; returned: whether everything is in it.
  using File = std::function<bool()>;
  /// The log outlives it.
  SessionLogWriting(std::vector<File> files, AgentLog& log) : _log(log), _files(std::move(files)) {}

  /// Writes the files, or waits for the one who does. Returned: whether everything is in them.
  bool run();

 private:
  [[nodiscard]] bool _write();

  AgentLog& _log;
  std::mutex _lock;
  std::vector<File> _files;  // gone once they are written, with what they hold
  bool _isDone = false;
  bool _isWritten = false;
};

}  // namespace zal
