#pragma once

#include <atomic>
#include <string>
#include <thread>

namespace zal::testing {

/// A client on a thread of its own that asks for one barrier after the other, each of which the agent's
/// main thread answers.
class KnockingClient {
 public:
  explicit KnockingClient(const std::string& socketPath);
  ~KnockingClient();
  KnockingClient(const KnockingClient&) = delete;
  KnockingClient& operator=(const KnockingClient&) = delete;

  /// All that were answered so far.
  [[nodiscard]] std::size_t answers() const { return _answers; }

 private:
  void _knock(const std::string& socketPath);

  std::atomic<bool> _stop = false;
  std::atomic<std::size_t> _answers = 0;
  std::thread _thread;
};

}  // namespace zal::testing
