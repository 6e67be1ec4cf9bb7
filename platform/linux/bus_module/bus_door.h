#pragma once

#include <cstddef>
#include <string>

#include "platform/ipc_peer.h"

namespace zal {

/// What became known of a collection, as the bus tells it.
struct DumpNews {
  std::string directory;  ///< that is being filled; names the collection
  std::string service;    ///< session type
  std::string event;      ///< "begin", "step", "missing", "done", "failed", "cut off"
  std::size_t step = 0;   ///< the current one, from 1; 0: none yet
  std::size_t steps = 0;  ///< how many are planned
  std::string what;       ///< the step's name, or what the archive will not have
  std::string detail;     ///< why it will not, why it failed, or where the archive lies
};

/// The agent's name on its bus, beside its socket: each caller there is a peer of the same handler,
/// with the same rights. Main thread only.
class BusDoor {
 public:
  virtual ~BusDoor() = default;
  /// Wants the bus and the name from now on, also after the bus was gone. A name that cannot be had is
  /// said once. Once; the handler's exceptions are thrown to the main loop.
  virtual void open(PeerHandler onPeerEvent) = 0;
  /// Delivers that error to every peer.
  virtual void terminationImminent() = 0;
  /// Tells whoever listens on the bus; nothing while there is none.
  virtual void announce(const DumpNews& news) = 0;
};

}  // namespace zal
