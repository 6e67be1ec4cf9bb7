#pragma once

#include <atomic>
#include <memory>
#include <string>

#include <asio/io_context.hpp>

#include "platform/linux/ping/linux_ping_facility.h"
#include "platform/linux/ping/ping_report.h"
#include "platform/ping_test.h"

namespace zal {

class AgentLog;
class PingAttempt;

/// One ping, as any thread sees it; the work is its attempt's, on the loop. See LinuxPingFacility
/// for threads and lifetimes.
class LinuxPingTest : public PingTest, public std::enable_shared_from_this<LinuxPingTest> {
 public:
  /// A minute shows what a call suffers from, periodic trouble included, in a file that one still reads.
  static constexpr double kLongTimeInterval = 60.0;
  /// What is asked for beyond that is cut to it: a week.
  static constexpr double kLongestSeconds = 7.0 * 24 * 3600;

  LinuxPingTest(asio::io_context& context, AgentLog& log, std::string address, std::string interface,
                PingMethods methods, const RootedPaths& paths);

  [[nodiscard]] double longTimeInterval() const override { return kLongTimeInterval; }
  void startWithTimeout(double seconds, WorkQueue& queue, CompletionHandler handler) override;
  bool writeResultsToFile(const std::string& path, std::string& error) override;
  [[nodiscard]] double secondsToRun() const override { return _secondsToRun; }
  void stop() override;

 private:
  asio::io_context& _context;
  AgentLog& _log;
  const std::string _host, _interface;
  const PingMethods _methods;
  const RootedPaths& _paths;
  const std::shared_ptr<PingReport> _report;
  std::atomic<double> _secondsToRun{0};
  std::weak_ptr<PingAttempt> _attempt;  // loop thread only; the loop's pending work owns it
};

}  // namespace zal
