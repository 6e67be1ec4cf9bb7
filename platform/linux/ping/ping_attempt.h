#pragma once

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include <asio/io_context.hpp>
#include <asio/ip/address.hpp>
#include <asio/ip/udp.hpp>
#include <asio/steady_timer.hpp>

#include "platform/linux/ping/linux_ping_facility.h"
#include "platform/linux/ping/ping_report.h"
#include "platform/linux/ping/ping_run.h"
#include "platform/ping_test.h"

namespace zal {

class AgentLog;

/// What is to be pinged, how long, and who wants to know.
struct PingTask {
  std::string host, interface;
  PingMethods methods;
  std::chrono::nanoseconds duration{0};
  std::shared_ptr<PingReport> report;
  WorkQueue* queue = nullptr;  ///< not null until the completion was queued
  PingTest::CompletionHandler handler;
};

/// One ping on the loop: finds the address, then the first way of pinging that the host permits,
/// then lets it run until the time is over. Loop thread only. From begin() to the completion its
/// pending timer owns it, so that it goes with the loop when that goes first, whoever else holds the
/// test.
class PingAttempt : public std::enable_shared_from_this<PingAttempt> {
 public:
  PingAttempt(asio::io_context& context, AgentLog& log, PingTask task);
  void begin();
  /// Completes with what there is; nothing when it completed before.
  void end();

 private:
  void _armDeadline(std::chrono::nanoseconds duration);
  void _resolve();
  void _pingFirstReachable(const std::vector<asio::ip::address>& candidates);
  void _openRun(const asio::ip::address& peer, const SourceProbe& probe);
  void _start(const std::shared_ptr<PingRun>& run);
  void _addHeading(const asio::ip::address& peer, const SourceProbe& probe);
  void _fail(std::string reason);
  void _complete();

  asio::io_context& _context;
  AgentLog& _log;
  PingTask _task;
  std::shared_ptr<PingRun> _run;
  asio::ip::udp::resolver _resolver;
  asio::steady_timer _deadline;
};

}  // namespace zal
