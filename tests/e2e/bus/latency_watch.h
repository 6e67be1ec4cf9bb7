#pragma once

#include <atomic>
#include <chrono>
#include <string>
#include <thread>

namespace zal::testing {

/// A client that asks for one barrier after the other, each of which the agent's main thread answers:
/// the longest wait is the longest time that it was held up, plus what the machine adds.
class LatencyWatch {
 public:
  explicit LatencyWatch(const std::string& socketPath);
  ~LatencyWatch();
  LatencyWatch(const LatencyWatch&) = delete;
  LatencyWatch& operator=(const LatencyWatch&) = delete;

  /// Of the waits that ended since the last call, and of the one that is open.
  [[nodiscard]] std::chrono::milliseconds takeLongest();
  /// All that were answered so far.
  [[nodiscard]] std::size_t answers() const { return _answers; }

 private:
  using Time = std::chrono::steady_clock::time_point;
  void _watch(const std::string& socketPath);

  std::atomic<bool> _stop = false;
  std::atomic<std::size_t> _answers = 0;
  std::atomic<std::chrono::steady_clock::rep> _longest = 0;
  std::atomic<Time> _asked;
  std::thread _thread;
};

}  // namespace zal::testing
