#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>

#include "platform/linux/files/descriptor.h"

namespace zal {

/// What goes to the journal as one datagram: the bytes, or in their place the sealed memory that
/// holds them.
struct JournalDatagram {
  std::string_view bytes;
  int memory = -1;
};

/// The way to the journal's datagram socket. Never waits. Main thread only.
class JournalSocket {
 public:
  /// Why a send ended before its last datagram.
  enum class Stop {
    none,
    full,      ///< the journal does not take more now
    tooLarge,  ///< the next one is too large for a datagram
    refused,   ///< the next one cannot be sent
    gone,      ///< nobody listens there any more; the socket is closed
  };
  struct Sent {
    std::size_t count;
    Stop stop;
  };

  /// Leaves the old way, if any. Returned: whether there is a journal at the path.
  bool connect(const std::string& path);
  void close() { _socket = {}; }
  [[nodiscard]] bool isConnected() const { return _socket.isOpen(); }
  /// Sends from the front on until one does not go. Not when closed.
  [[nodiscard]] Sent send(std::span<const JournalDatagram> datagrams);

 private:
  Descriptor _socket;
};

}  // namespace zal
