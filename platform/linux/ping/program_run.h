#pragma once

#include <sys/types.h>

#include <array>
#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>
#include <asio/steady_timer.hpp>

#include "platform/linux/ping/ping_run.h"

namespace zal {

class PingReport;

/// The last resort: the ping program does it and its output is the report. The process may be
/// permitted what we are not. Loop thread only; a shared_ptr owns it.
class ProgramRun : public PingRun, public std::enable_shared_from_this<ProgramRun> {
 public:
  /// After being asked to end, a program that still runs is killed.
  static constexpr std::chrono::seconds kPatience{2};

  ProgramRun(asio::io_context& context, std::vector<std::string> command, std::shared_ptr<PingReport> report,
             std::function<void()> onEnd);
  ~ProgramRun() override;
  void start() override;
  void stop() override;

 private:
  [[nodiscard]] int _spawn();
  void _readMore();
  void _collect();
  void _end(const std::string& failure);

  asio::posix::stream_descriptor _output;
  asio::steady_timer _patience;
  std::vector<std::string> _command;
  std::shared_ptr<PingReport> _report;
  std::function<void()> _onEnd;
  pid_t _child = -1;  // -1: not started, or taken back
  std::array<char, 4096> _buffer{};
  std::string _text;
};

/// The command for one peer over one interface, numeric, for that many seconds.
[[nodiscard]] std::vector<std::string> pingCommand(const std::string& program, const std::string& address,
                                                   const std::string& interface,
                                                   std::chrono::nanoseconds duration);

}  // namespace zal
