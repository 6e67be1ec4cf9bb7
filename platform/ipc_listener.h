#pragma once

#include <functional>
#include <memory>
#include <string>

#include "platform/ipc_peer.h"

namespace zal {

/// The agent's named door. Handlers run on the main thread, one event at a time.
class IpcListener {
 public:
  using ErrorHandler = std::function<void()>;
  virtual ~IpcListener() = default;
  /// Starts delivering. A listener that cannot be had (taken name, no directory) says why in one
  /// warning and calls the error handler from the run loop, never inside resume().
  virtual void resume(ErrorHandler onInvalid, PeerHandler onPeerEvent) = 0;
};

/// Makes listeners by service name. Main thread only.
class IpcService {
 public:
  virtual ~IpcService() = default;
  [[nodiscard]] virtual std::unique_ptr<IpcListener> makeListener(std::string serviceName) = 0;
};

}  // namespace zal
