#pragma once

#include <atomic>
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

/// One ping on the loop: finds the address, then the first way of pinging that the host permits,
/// then lets it run until the time is over. See LinuxPingFacility for threads and lifetimes.
class LinuxPingTest : public PingTest, public std::enable_shared_from_this<LinuxPingTest> {
 public:
  /// A minute shows what a call suffers from, periodic trouble included, in a file that one still reads.
  static constexpr double kLongTimeInterval = 60.0;
  /// What is asked for beyond that is cut to it: a week.
  static constexpr double kLongestSeconds = 7.0 * 24 * 3600;

  LinuxPingTest(asio::io_context& context, AgentLog& log, std::string address, std::string interface,
                PingMethods methods);

  [[nodiscard]] double longTimeInterval() const override { return kLongTimeInterval; }
  void startWithTimeout(double seconds, WorkQueue& queue, CompletionHandler handler) override;
  bool writeResultsToFile(const std::string& path, std::string& error) override;
  [[nodiscard]] double secondsToRun() const override { return _secondsToRun; }
  void stop() override;

 private:
  void _begin();
  void _armDeadline(std::chrono::nanoseconds duration);
  void _timeIsOver();
  void _resolve();
  void _pingFirstReachable(const std::vector<asio::ip::address>& candidates);
  void _openRun(const asio::ip::address& peer, const SourceProbe& probe);
  void _start(std::shared_ptr<PingRun> run);
  void _addHeading(const asio::ip::address& peer, const SourceProbe& probe);
  void _fail(std::string reason);
  void _complete();

  asio::io_context& _context;
  AgentLog& _log;
  const std::string _host, _interface;
  const PingMethods _methods;
  const std::shared_ptr<PingReport> _report;
  std::atomic<double> _secondsToRun{0};

  // Loop thread only from here on.
  std::chrono::nanoseconds _duration{0};
  WorkQueue* _queue = nullptr;  // not null while it runs
  CompletionHandler _handler;
  std::shared_ptr<PingRun> _run;
  asio::ip::udp::resolver _resolver;
  asio::steady_timer _deadline;  // its pending wait keeps a running test alive
};

}  // namespace zal
