#include "agent/message_handler.h"

#include <cstddef>
#include <cstdint>
#include <exception>
#include <string>

#include "agent/request_table.h"
#include "platform/main_thread_watch.h"
#include "session/session_writings.h"

namespace zal {
namespace {

constexpr std::string_view kIpcCategory = "IPC";

std::string peerText(const PeerConnection& peer) { return "peer(" + std::to_string(peer.processId()) + ")"; }

}  // namespace

void MessageHandler::operator()(const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) const {
  try {
    if (const auto* error = std::get_if<IpcError>(&event)) {
      _handleError(*peer, *error);
    } else if (const auto* message = std::get_if<const Message*>(&event); message != nullptr && *message) {
      _handleMessage(peer, **message);
    }
  } catch (const std::exception& exception) {
    _agentLog->warning("A request of " + peerText(*peer) + " was given up: " + exception.what());
  }
}

void MessageHandler::_handleError(PeerConnection& peer, IpcError error) const {
  std::string_view name;
  switch (error) {
    case IpcError::connectionInvalid:
      name = "IPC_ERROR_CONNECTION_INVALID";
      break;
    case IpcError::connectionInterrupted:
      name = "IPC_ERROR_CONNECTION_INTERRUPTED";
      break;
    case IpcError::terminationImminent:
      name = "IPC_ERROR_TERMINATION_IMMINENT";
      break;
    case IpcError::other:
      return;
  }
  if (_agentLog->isEnabled(kIpcCategory)) {
    _agentLog->log(kIpcCategory, peerText(peer).append(" received ").append(name));
  }
  if (error == IpcError::connectionInvalid) peer.cancel();
}

void MessageHandler::_handleMessage(const std::shared_ptr<PeerConnection>& peer,
                                    const Message& message) const {
  if (_agentLog->isEnabled(kIpcCategory)) {
    _agentLog->log(kIpcCategory, "received message from " + peerText(*peer) + ": " + message.description());
  }
  // Unsigned, so that negative codes are above every row too.
  const auto code = static_cast<std::uint64_t>(message.int64(kEventCodeKey));
  const auto table = requestTable();
  if (code >= table.size()) return;
  const MainThreadWatch::Span span("request", table[code].name);
  const std::size_t begun = _writings != nullptr ? _writings->begun() : 0;
  table[code].carryOut({*_server, *_clock, peer, message});
  if (_writings != nullptr && _writings->begun() != begun) _writings->keepUntilFinished(peer->holdBarriers());
}

}  // namespace zal
