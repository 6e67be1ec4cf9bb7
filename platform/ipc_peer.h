#pragma once

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <variant>

#include "platform/ipc_message.h"
#include "platform/value.h"

namespace zal {

/// One client's connection. Main thread only. Shared: whoever owes a reply keeps it.
class PeerConnection {
 public:
  virtual ~PeerConnection() = default;
  /// From the kernel, taken when the peer connected.
  [[nodiscard]] virtual pid_t processId() const = 0;
  /// False once cancelled or invalid; then sendReply does nothing.
  [[nodiscard]] virtual bool isConnected() const = 0;
  /// Answers the message that gave the token. Returned: whether it was accepted for sending.
  virtual bool sendReply(std::uint64_t replyToken, const ValueMap& reply) = 0;
  /// What a message of this peer set going is not over yet: its barriers are answered once whoever holds this
  /// has let go of it, on the main thread. Nothing where there are no barriers.
  [[nodiscard]] virtual std::shared_ptr<void> holdBarriers() { return nullptr; }
  /// Ends the connection; no event is delivered after this.
  virtual void cancel() = 0;
};

enum class IpcError {
  connectionInvalid,      ///< the peer is gone, or sent what cannot be resynchronised
  connectionInterrupted,  ///< something was lost; the peer stays usable
  terminationImminent,    ///< the agent is about to end
  other,
};

/// What arrives from a peer: an error, a message (borrowed for the call), or something else that
/// is neither (monostate).
using IpcEvent = std::variant<std::monostate, IpcError, const Message*>;
using PeerHandler = std::function<void(const std::shared_ptr<PeerConnection>&, const IpcEvent&)>;

}  // namespace zal
