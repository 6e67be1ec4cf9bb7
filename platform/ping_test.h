#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "platform/work_queue.h"

namespace zal {

/// Stands for "the default gateway of the interface" where an address is asked for.
inline constexpr std::string_view kDefaultGatewayAddress = "<default gateway>";

/// One ping of one address. Any thread. It must be owned by a shared_ptr; a running test keeps
/// itself alive until it completed.
///
///     auto test = facility.makeTest("198.51.100.1", true);
///     test->startWithTimeout(8.0, queue, [test](std::string_view result, bool success) { ... });
class PingTest {
 public:
  /// The result or the error in one line, and whether an answer came at all.
  using CompletionHandler = std::function<void(std::string_view result, bool success)>;
  virtual ~PingTest() = default;
  /// Seconds that a test without an explicit duration runs.
  [[nodiscard]] virtual double longTimeInterval() const = 0;
  /// Returns at once; pings for at most that long and then calls the handler on the queue, exactly
  /// once, also after stop() and after every failure. Call it once. The queue outlives the test.
  virtual void startWithTimeout(double seconds, WorkQueue& queue, CompletionHandler handler) = 0;
  /// Writes what was collected so far. On failure: false and the reason in `error`.
  virtual bool writeResultsToFile(const std::string& path, std::string& error) = 0;
  /// Seconds the test was asked to run; 0 before it was started.
  [[nodiscard]] virtual double secondsToRun() const = 0;
  /// Ends a running test early; it completes with what it has.
  virtual void stop() = 0;
};

/// The host's ping facility. Any thread.
class PingFacility {
 public:
  virtual ~PingFacility() = default;
  /// Prepares a ping over the Wi-Fi interface, or the cellular one when the flag is not set.
  [[nodiscard]] virtual std::shared_ptr<PingTest> makeTest(std::string address, bool useWifi) = 0;
};

}  // namespace zal
