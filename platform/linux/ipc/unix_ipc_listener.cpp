#include "platform/linux/ipc/unix_ipc_listener.h"

#include <sys/socket.h>

#include <cerrno>
#include <chrono>
#include <system_error>
#include <vector>

#include <asio/post.hpp>

#include "platform/linux/ipc/unix_peer_connection.h"

namespace zal {
namespace {

/// Newcomers let in before others get their turn.
constexpr int kAcceptsPerTurn = 64;
constexpr std::chrono::seconds kRetryDelay{1};

bool isExhaustion(int error) {
  return error == EMFILE || error == ENFILE || error == ENOBUFS || error == ENOMEM;
}

/// Concerns the one connection, which is gone by now; the next may be fine.
bool isPassing(int error) {
  return error == ECONNABORTED || error == EINTR || error == EPERM || error == EPROTO;
}

}  // namespace

UnixIpcListener::UnixIpcListener(std::shared_ptr<IpcContext> context, RunLoop& loop, std::string serviceName,
                                 std::string path, Descriptor passed)
    : _context(std::move(context)),
      _loop(loop),
      _serviceName(std::move(serviceName)),
      _path(std::move(path)),
      _passed(std::move(passed)),
      _alive(std::make_shared<UnixIpcListener*>(this)) {}

UnixIpcListener::~UnixIpcListener() {
  _context->delivering = false;
  _stopListening();
  const std::vector<std::shared_ptr<UnixPeerConnection>> peers(_context->peers.begin(),
                                                               _context->peers.end());
  for (const auto& peer : peers) peer->cancel();
}

void UnixIpcListener::resume(ErrorHandler onInvalid, PeerHandler onPeerEvent) {
  _context->mainThread.check("UnixIpcListener");
  _onInvalid = std::move(onInvalid);
  _context->handler = std::move(onPeerEvent);
  _context->delivering = true;
  const std::string& groupName = _context->settings.group;
  const auto group = groupIdentifier(groupName);
  if (!group && !groupName.empty()) {
    _context->log.warning("There is no group " + groupName +
                          "; only the superuser and the agent's own user may talk to it");
  }
  _access = AccessPolicy(group);
  if (_listen(group)) _awaitPeers();
}

bool UnixIpcListener::_listen(std::optional<gid_t> group) {
  std::string trouble;
  auto listening = _passed.isOpen() ? ListeningSocket::adopt(std::move(_passed), trouble)
                                    : ListeningSocket::bindPath(_path, group, trouble);
  if (!listening) {
    _becomeInvalid(trouble);
    return false;
  }
  _listening.emplace(*std::move(listening));
  _readiness.emplace(_context->io, _listening->descriptor());
  _context->stopListening = [alive = std::weak_ptr(_alive)] {
    if (const auto self = alive.lock()) (*self)->_stopListening();
  };
  return true;
}

void UnixIpcListener::_stopListening() {
  if (_readiness) static_cast<void>(_readiness->release());  // _listening closes it
  _readiness.reset();
  _listening.reset();
  _retry.cancel();
}

void UnixIpcListener::_awaitPeers() {
  _readiness->async_wait(asio::posix::descriptor_base::wait_read,
                         [alive = std::weak_ptr(_alive)](const std::error_code& error) {
                           const auto self = alive.lock();
                           if (self && !error) (*self)->_acceptTurn();
                         });
}

void UnixIpcListener::_acceptTurn() {
  for (int accepted = 0; accepted < kAcceptsPerTurn; ++accepted) {
    Descriptor socket(::accept4(_listening->descriptor(), nullptr, nullptr, SOCK_CLOEXEC | SOCK_NONBLOCK));
    if (socket.isOpen()) {
      _admit(std::move(socket));
    } else if (errno == EAGAIN || errno == EWOULDBLOCK) {
      _saidExhausted = false;
      return _awaitPeers();
    } else if (isExhaustion(errno)) {
      return _waitForDescriptors(errno);
    } else if (!isPassing(errno)) {
      return _becomeInvalid("accepting failed: " + std::generic_category().message(errno));
    }
  }
  _awaitPeers();
}

void UnixIpcListener::_admit(Descriptor socket) {
  const auto credentials = peerCredentials(socket.get());
  if (!credentials) return;
  if (!_access.admits(*credentials)) {
    _context->log.warning("Process " + std::to_string(credentials->process) + " of user " +
                          std::to_string(credentials->user) +
                          " may not talk to the agent; it is disconnected");
    return;
  }
  std::make_shared<UnixPeerConnection>(_context, std::move(socket), *credentials)->start();
}

/// The newcomer stays in the kernel's queue, so the socket stays ready: waiting for that would spin.
void UnixIpcListener::_waitForDescriptors(int error) {
  if (!std::exchange(_saidExhausted, true)) {
    _context->log.warning("New connections have to wait: " + std::generic_category().message(error));
  }
  _retry = ScopedTimer(_loop, _loop.callAfter(kRetryDelay, [this] { _acceptTurn(); }));
}

void UnixIpcListener::_becomeInvalid(const std::string& trouble) {
  _context->log.warning("Cannot serve " + _serviceName + ": " + trouble);
  _loop.post([alive = std::weak_ptr(_alive)] {
    const auto self = alive.lock();
    if (self && (*self)->_onInvalid) (*self)->_onInvalid();
  });
}

}  // namespace zal
