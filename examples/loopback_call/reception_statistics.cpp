#include "examples/loopback_call/reception_statistics.h"

#include <cmath>

namespace loopback {

void ReceptionStatistics::received(const MediaPacket& packet, std::uint64_t arrival) {
  if (_packets == 0) {
    _firstSequence = _highestSequence = packet.sequence;
  } else {
    const auto step =
        static_cast<std::int16_t>(packet.sequence - static_cast<std::uint16_t>(_highestSequence));
    if (step > 0) _highestSequence += static_cast<std::uint64_t>(step);
    // RFC 3550 A.8: how much the spacing of two packets changed on the way, smoothed by 1/16.
    const double sentApart = static_cast<double>(packet.sentAt) - static_cast<double>(_lastSentAt);
    const double cameApart = static_cast<double>(arrival) - static_cast<double>(_lastArrival);
    _jitter += (std::abs(cameApart - sentApart) - _jitter) / 16.0;
  }
  ++_packets;
  _lastSentAt = packet.sentAt;
  _lastArrival = arrival;
  if (packet.echoOfSentAt != 0) {
    _roundTrip =
        (static_cast<double>(arrival - packet.echoOfSentAt) - static_cast<double>(packet.echoHeldFor)) / 1e6;
  }
}

double ReceptionStatistics::lossPercent() const {
  if (_packets == 0) return 0.0;
  const double expected = static_cast<double>(_highestSequence - _firstSequence + 1);
  return std::fmax(0.0, 100.0 * (expected - static_cast<double>(_packets)) / expected);
}

void ReceptionStatistics::echoInto(MediaPacket& outgoing, std::uint64_t now) const {
  if (_packets == 0) return;
  outgoing.echoOfSentAt = _lastSentAt;
  outgoing.echoHeldFor = now - _lastArrival;
}

}  // namespace loopback
