#pragma once

#include <cstdint>
#include <string>

#include "examples/loopback_call/reception_statistics.h"

namespace loopback {

/// One side of the call: a UDP socket on a free port of the loopback interface that sends a packet
/// whenever it is told to and measures what comes in. One thread.
class MediaEndpoint {
 public:
  /// Throws std::system_error when the host gives no socket.
  explicit MediaEndpoint(std::uint32_t source);
  ~MediaEndpoint();
  MediaEndpoint(const MediaEndpoint&) = delete;
  MediaEndpoint& operator=(const MediaEndpoint&) = delete;

  [[nodiscard]] int descriptor() const { return _socket; }
  [[nodiscard]] std::string address() const;  ///< "127.0.0.1:PORT"
  [[nodiscard]] const ReceptionStatistics& statistics() const { return _statistics; }
  [[nodiscard]] std::uint64_t sent() const { return _sent; }

  void callTo(const MediaEndpoint& other);
  void sendPacket();
  /// Takes everything that waits in the socket.
  void receivePackets();

 private:
  int _socket = -1;
  std::uint16_t _port = 0;
  std::uint32_t _source;
  std::uint64_t _sent = 0;
  ReceptionStatistics _statistics;
};

/// The steady clock, nanoseconds.
std::uint64_t steadyNanoseconds();

}  // namespace loopback
