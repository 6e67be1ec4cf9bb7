#include "platform/linux/ipc/unix_ipc_service.h"

#include <utility>
#include <vector>

#include "platform/linux/ipc/listening_socket.h"
#include "platform/linux/ipc/unix_ipc_listener.h"
#include "platform/linux/ipc/unix_peer_connection.h"

namespace zal {
namespace {

/// A copy: what is done to a peer may take it, or others, out of the set.
std::vector<std::shared_ptr<UnixPeerConnection>> peersOf(const IpcContext& context) {
  return {context.peers.begin(), context.peers.end()};
}

}  // namespace

UnixIpcService::UnixIpcService(asio::io_context& context, RunLoop& loop, AgentLog& log, Options options)
    : _loop(loop),
      _path(std::move(options.path)),
      _passed(takePassedListener()),
      _context(std::make_shared<IpcContext>(context, log, std::move(options.settings),
                                            std::move(options.flush), std::move(options.confirm))) {}

UnixIpcService::~UnixIpcService() {
  for (const auto& peer : peersOf(*_context)) peer->cancel();
}

std::unique_ptr<IpcListener> UnixIpcService::makeListener(std::string serviceName) {
  return std::make_unique<UnixIpcListener>(_context, _loop, std::move(serviceName), _path,
                                           std::move(_passed));
}

void UnixIpcService::terminationImminent() {
  for (const auto& peer : peersOf(*_context)) peer->deliverError(IpcError::terminationImminent);
}

void UnixIpcService::stopListening() { _context->stopListening(); }

}  // namespace zal
