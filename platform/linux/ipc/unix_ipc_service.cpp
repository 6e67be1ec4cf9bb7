#include "platform/linux/ipc/unix_ipc_service.h"

#include <unistd.h>

#include <algorithm>
#include <utility>
#include <vector>

#include "platform/linux/ipc/listening_socket.h"
#include "platform/linux/ipc/unix_ipc_listener.h"
#include "platform/linux/ipc/unix_peer_connection.h"
#include "platform/linux/loop/steady_time.h"

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
                                            std::move(options.flush), std::move(options.confirm),
                                            options.memory)),
      _shares(std::move(options.sharesPath)) {
  _context->showShares = [this] { _showShares(); };
}

UnixIpcService::~UnixIpcService() {
  _context->showShares = [] {};
  for (const auto& peer : peersOf(*_context)) peer->cancel();
}

void UnixIpcService::_showShares() {
  const SteadyTime now = roughSteadyTime();
  if (!_shares.isDue(now) || _context->memory == nullptr) return;
  ClientShares shares{.agent = ::getpid(), .bytes = _context->memory->total(), .clients = {}};
  for (const auto& peer : _context->peers) shares.clients.push_back(peer->share());
  std::sort(shares.clients.begin(), shares.clients.end(),
            [](const ClientShare& a, const ClientShare& b) { return a.process < b.process; });
  _shares.write(shares, now);
}

std::unique_ptr<IpcListener> UnixIpcService::makeListener(std::string serviceName) {
  return std::make_unique<UnixIpcListener>(_context, _loop, std::move(serviceName), _path,
                                           std::move(_passed));
}

void UnixIpcService::terminationImminent() {
  for (const auto& peer : peersOf(*_context)) peer->deliverError(IpcError::terminationImminent);
}

void UnixIpcService::stopListening() {
  _context->stopListening();
  _shares.remove();
}

}  // namespace zal
