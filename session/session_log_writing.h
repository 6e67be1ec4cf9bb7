#pragma once

#include <functional>
#include <mutex>
#include <vector>

#include "platform/agent_log.h"

namespace zal {

/// Files of one ended session, its logs or those that were collected, put into its directory once, by whoever
/// comes first. Any thread.
class SessionLogWriting {
 public:
  /// Writes or moves; returned: whether everything is there.
  using File = std::function<bool()>;
  /// The log outlives it.
  SessionLogWriting(std::vector<File> files, AgentLog& log) : _log(log), _files(std::move(files)) {}

  /// Does it, or waits for the one who does. Returned: whether everything is there.
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
