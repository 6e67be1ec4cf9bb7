#pragma once

#include <memory>
#include <optional>
#include <string>

namespace zal {

class AgentLog;
class PingFacility;
class WorkQueues;

/// Runs the process's ping tests: lists them, starts them one after the other, writes their results
/// and logs how they ended, under the category "Ping". Any thread; every operation returns at once.
/// Tests that are still running when the runner goes finish by themselves, as long as the services
/// it was made with are there.
class _ZalLoggingAgentPingRunner {
 public:
  /// Longer tests are stopped by stopAllTests(); tests up to this long end soon enough by themselves.
  static constexpr double kLongestUnstoppedSeconds = 15.0;

  /// The services are borrowed and outlive every test.
  _ZalLoggingAgentPingRunner(WorkQueues& queues, PingFacility& pings, AgentLog& log);
  ~_ZalLoggingAgentPingRunner();
  _ZalLoggingAgentPingRunner(const _ZalLoggingAgentPingRunner&) = delete;
  _ZalLoggingAgentPingRunner& operator=(const _ZalLoggingAgentPingRunner&) = delete;

  /// The process's one runner; null until the entry has named it.
  [[nodiscard]] static _ZalLoggingAgentPingRunner* sharedInstance();
  /// For the entry, which owns the runner; null takes it back before the runner goes.
  static void setSharedInstance(_ZalLoggingAgentPingRunner* runner);

  /// Queues a ping. No address means the default gateway; a duration of 0 or less means as long as
  /// such tests run by default (seconds). The results go into the output path, if there is one.
  void addPingTest(std::optional<std::string> address, double duration, bool useWifi,
                   std::optional<std::string> outputPath);
  /// The same with the output path in two halves, joined by "/" whatever they end with; there is
  /// none unless both are given.
  void addPingTest(std::optional<std::string> address, double duration, bool useWifi,
                   const std::optional<std::string>& pathDirectory,
                   const std::optional<std::string>& fileName);
  /// Stops the long tests and forgets all of them; those that go on still complete.
  void stopAllTests();

 private:
  struct State;
  std::shared_ptr<State> _state;  // shared with the queued jobs, which may outlive the runner
};

}  // namespace zal
