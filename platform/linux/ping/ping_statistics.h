#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace zal {

/// What a run of echo requests amounts to. Duplicates count for nothing but themselves.
class PingStatistics {
 public:
  std::uint64_t transmitted = 0;
  std::uint64_t duplicates = 0;
  std::uint64_t errors = 0;              ///< ICMP errors about our requests, and refused sends
  std::chrono::milliseconds elapsed{0};  ///< from the first request to what happened last

  void addAnswer(std::chrono::microseconds roundTrip);
  [[nodiscard]] std::uint64_t received() const { return _received; }

  /// "3 packets transmitted, 2 received, 33.3333% packet loss, time 2004ms", with ", +1 duplicates"
  /// and ", +1 errors" in its middle where there were any.
  [[nodiscard]] std::string summary() const;
  /// "rtt min/avg/max/mdev = 0.045/0.061/0.077/0.016 ms"; empty without an answer.
  [[nodiscard]] std::string roundTripLine() const;

 private:
  std::uint64_t _received = 0;
  // Microseconds. The mean and the sum of squared deviations are carried forward, so that no
  // difference of two large sums is ever taken.
  double _least = 0, _greatest = 0, _mean = 0, _squaredDeviations = 0;
};

}  // namespace zal
