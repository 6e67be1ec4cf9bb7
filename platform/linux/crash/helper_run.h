#pragma once

#include <sys/types.h>

#include <array>
#include <atomic>
#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>

#include "platform/agent_log.h"
#include "platform/linux/files/descriptor.h"

namespace zal {

/// One run of the helper program: started on any thread, buried when it ends. What it says, the report's
/// path or why there is none, becomes one line of the log. A run that is dropped before its end goes on
/// by itself. A shared_ptr owns it.
class HelperRun : public std::enable_shared_from_this<HelperRun> {
 public:
  /// `what` names the report in the log; `running` counts this run until its end.
  HelperRun(AgentLog& log, std::string what, std::shared_ptr<std::atomic<int>> running);
  ~HelperRun();
  HelperRun(const HelperRun&) = delete;
  HelperRun& operator=(const HelperRun&) = delete;

  /// Once. Returned: zero, or the errno that says why it did not start.
  [[nodiscard]] int start(const std::vector<std::string>& command);
  /// Waits for the end on this thread, so long at most. Returned: whether it has ended.
  bool waitForEnd(std::chrono::milliseconds most);
  /// The loop sees to the end from now on. Last call of the starting thread.
  void leaveTo(asio::io_context& loop);

 private:
  void _readMore(const std::shared_ptr<asio::posix::stream_descriptor>& output);
  void _take(std::size_t size);
  void _bury();

  AgentLog& _log;
  const std::string _what;
  const std::shared_ptr<std::atomic<int>> _running;
  Descriptor _output;
  pid_t _child = -1;  // -1: not started, or buried
  std::string _said;
  std::array<char, 1024> _buffer{};
};

}  // namespace zal
