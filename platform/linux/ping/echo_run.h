#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <unordered_map>

#include <asio/io_context.hpp>
#include <asio/posix/stream_descriptor.hpp>
#include <asio/steady_timer.hpp>

#include "platform/linux/ping/echo_socket.h"
#include "platform/linux/ping/ping_run.h"

namespace zal {

class PingReport;

/// Sends one echo request a second until it is stopped and puts what comes back into the report.
/// Loop thread only; a shared_ptr owns it. It ends by itself only when every request was answered and
/// no further one fits into its time: what is down may come up again.
class EchoRun : public PingRun, public std::enable_shared_from_this<EchoRun> {
 public:
  /// What people know a ping to do; also gentle to a network that is in trouble.
  static constexpr std::chrono::seconds kInterval{1};

  /// Whoever stops it does so after `duration`.
  EchoRun(asio::io_context& context, EchoSocket socket, std::chrono::nanoseconds duration,
          std::shared_ptr<PingReport> report, std::function<void()> onEnd);
  ~EchoRun() override;
  void start() override;
  void stop() override;

 private:
  using Moment = std::chrono::steady_clock::time_point;
  struct Request {
    Moment sent;
    bool answered = false;
  };
  void _sendNext();
  void _waitForEvents();
  void _takeEvents();
  void _take(const EchoAnswer& answer);
  void _take(const EchoRefusal& refusal);
  [[nodiscard]] std::chrono::milliseconds _elapsed() const;
  [[nodiscard]] bool _hasNothingToWaitFor() const;

  EchoSocket _socket;
  asio::posix::stream_descriptor _readiness;  // looks at the socket's descriptor, does not own it
  asio::steady_timer _timer;
  std::shared_ptr<PingReport> _report;
  std::function<void()> _onEnd;
  const std::chrono::nanoseconds _duration;
  Moment _started;
  std::uint16_t _sequence = 0;
  std::size_t _unanswered = 0;
  std::unordered_map<std::uint16_t, Request> _requests;
};

}  // namespace zal
