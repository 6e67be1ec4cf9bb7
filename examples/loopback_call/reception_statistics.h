#pragma once

#include <cstdint>
#include <optional>

#include "examples/loopback_call/media_packet.h"

namespace loopback {

/// What one side measures of the packets that it receives, after RFC 3550: sections 6.4.1 (loss, round
/// trip) and A.8 (jitter).
class ReceptionStatistics {
 public:
  /// Takes one packet that arrived at this steady time, in nanoseconds.
  void received(const MediaPacket& packet, std::uint64_t arrival);

  /// Time from a packet of ours to its echo, less the time that the other side held it; the latest.
  [[nodiscard]] std::optional<double> roundTripMilliseconds() const { return _roundTrip; }
  /// Interarrival jitter, a running estimate.
  [[nodiscard]] double jitterMilliseconds() const { return _jitter / 1e6; }
  /// Of the packets that the other side numbered so far, the share that never came, in percent.
  [[nodiscard]] double lossPercent() const;
  [[nodiscard]] std::uint64_t packets() const { return _packets; }

  /// What the next packet to the other side says about the last one from it.
  void echoInto(MediaPacket& outgoing, std::uint64_t now) const;

 private:
  std::uint64_t _packets = 0;
  std::uint64_t _firstSequence = 0;
  std::uint64_t _highestSequence = 0;  // extended beyond 16 bits
  std::uint64_t _lastSentAt = 0;
  std::uint64_t _lastArrival = 0;
  double _jitter = 0;  // nanoseconds
  std::optional<double> _roundTrip;
};

}  // namespace loopback
