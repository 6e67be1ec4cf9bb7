#include "platform/linux/ipc/unix_peer_connection.h"

#include <sys/socket.h>

#include <cerrno>
#include <chrono>
#include <exception>
#include <utility>

#include <asio/post.hpp>

#include "platform/linux/loop/steady_time.h"
#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/wire_message.h"
#include "platform/main_thread_watch.h"

namespace zal {
namespace {

using asio::posix::descriptor_base;

/// Of what one client says in a moment without being in a hurry.
constexpr std::size_t kLargestLoneRead = 4096;

/// A client over its share is read this often all the same: nobody else's memory, nor a disk that refuses,
/// may shut it out.
constexpr std::chrono::seconds kLongestWait{1};

/// Has a client pay for what its requests make others keep.
class PayingPeer {
 public:
  PayingPeer(MemoryLedger* memory, const std::shared_ptr<MemoryAccount>& account) : _memory(memory) {
    if (_memory != nullptr) _memory->setPayer(account);
  }
  ~PayingPeer() {
    if (_memory != nullptr) _memory->setPayer(nullptr);
  }
  PayingPeer(const PayingPeer&) = delete;
  PayingPeer& operator=(const PayingPeer&) = delete;

 private:
  MemoryLedger* const _memory;
};

bool isRetryLater(int error) { return error == EAGAIN || error == EWOULDBLOCK; }

}  // namespace

UnixPeerConnection::UnixPeerConnection(std::shared_ptr<IpcContext> context, Descriptor socket,
                                       const PeerCredentials& credentials)
    : _context(std::move(context)), _credentials(credentials), _decoder(_context->settings.maximumPayload) {
  _socket.emplace(_context->io);
  _socket->assign(socket.get());
  static_cast<void>(socket.release());
}

void UnixPeerConnection::start() {
  _context->peers.insert(shared_from_this());
  _awaitInput();
}

void UnixPeerConnection::deliverError(IpcError error) {
  if (!_finished) _deliver(error);
}

void UnixPeerConnection::_deliver(const IpcEvent& event) {
  if (_context->delivering) _context->handler(shared_from_this(), event);
}

/// Waits instead of trying: after a read that did not fill the buffer another one would only find
/// nothing. Waiting notices by itself what came meanwhile.
void UnixPeerConnection::_awaitInput() {
  _socket->async_wait(descriptor_base::wait_read, [self = shared_from_this()](const std::error_code& error) {
    if (!error) self->_readTurn();
  });
}

void UnixPeerConnection::_readTurn() {
  _context->mainThread.check("UnixPeerConnection");
  const MainThreadWatch::Span span("reading a client");
  if (!_socket) return;
  const std::shared_ptr<PeerConnection> keptAlive = shared_from_this();
  char* const buffer = _context->readBuffer.get();
  const auto size = ::recv(_socket->native_handle(), buffer, kReadBufferSize, MSG_DONTWAIT);
  if (size < 0 && (isRetryLater(errno) || errno == EINTR)) {
    _isDelayed = false;
    return _awaitInput();
  }
  if (size == 0 && !_heldBarriers.empty()) {
    _saidAll = true;  // and may still listen for the answers
    return;
  }
  if (size <= 0) return _becomeInvalid();

  _decoder.feed({buffer, static_cast<std::size_t>(size)});
  {
    const PayingPeer paying(_context->memory, _account);
    _takeFrames(keptAlive);
  }
  if (!_socket) return;
  _isDelayed = false;
  _writeOutWhatCameAlone(static_cast<std::size_t>(size));
  _awaitTurn(static_cast<std::size_t>(size) == kReadBufferSize);
}

void UnixPeerConnection::_awaitTurn(bool hasMore) {
  if (_hasTooMuch()) return _awaitMemory();
  if (!hasMore) return _awaitInput();
  asio::post(_context->io, [self = shared_from_this()] { self->_readTurn(); });
}

bool UnixPeerConnection::_hasTooMuch() const {
  return _context->memory != nullptr && _context->memory->isOverShare(*_account);
}

/// What the client says meanwhile stays in the socket, until it fills and the client has to wait as well.
void UnixPeerConnection::_awaitMemory() {
  if (!std::exchange(_hearsOfMemory, true)) {
    _context->memory->onRelease([weak = weak_from_this()] {
      const auto self = weak.lock();
      if (!self) return;
      self->_hearsOfMemory = false;
      if (!self->_waiting) return;
      if (self->_hasTooMuch()) return self->_awaitMemory();
      self->_endWaiting();
    });
  }
  if (_waiting) return;
  _waiting.emplace(_context->io, kLongestWait);
  _waiting->async_wait([self = shared_from_this()](const std::error_code& error) {
    if (!error) self->_endWaiting();
  });
}

void UnixPeerConnection::_endWaiting() {
  _waiting.reset();
  if (!_socket) return;
  _isDelayed = true;
  asio::post(_context->io, [self = shared_from_this()] { self->_readTurn(); });
}

ClientShare UnixPeerConnection::share() const {
  return {.process = _credentials.process,
          .user = _credentials.user,
          .bytes = _account->bytes,
          .delayedMessages = _delayedMessages,
          .isWaiting = _waiting.has_value()};
}

/// A record that comes alone is in its file before the loop asks the kernel for more, twice, only to
/// hear that there is nothing. In a flood this happens once a tick.
void UnixPeerConnection::_writeOutWhatCameAlone(std::size_t size) {
  const SteadyTime now = roughSteadyTime();
  const bool isAlone = size <= kLargestLoneRead && now != _context->lastRead;
  _context->lastRead = now;
  if (isAlone && _context->flush) _context->flush();
}

void UnixPeerConnection::_takeFrames(const std::shared_ptr<PeerConnection>& self) {
  while (const auto frame = _decoder.next()) {
    _takeFrame(self, *frame);
    if (!_socket) return;  // cancelled by its handler, or dropped
  }
  if (_decoder.failed()) {
    _context->log.warning(_name() + " cannot be understood: " + _decoder.failure() + "; it is disconnected");
    _becomeInvalid();
  }
}

void UnixPeerConnection::_takeFrame(const std::shared_ptr<PeerConnection>& self, const Frame& frame) {
  switch (frame.header.kind) {
    case FrameKind::message:
    case FrameKind::messageExpectingReply:
      return _takeMessage(self, frame);
    case FrameKind::barrier:
      return _takeBarrier(frame.header.cookie);
    case FrameKind::reply:
    case FrameKind::barrierPassed:
      return _skipFrame();  // nothing was asked of a client
  }
}

void UnixPeerConnection::_takeMessage(const std::shared_ptr<PeerConnection>& self, const Frame& frame) {
  if (_isDelayed) ++_delayedMessages;
  const auto message = WireMessage::fromFrame(frame);
  if (!message) return _skipFrame();
  if (_context->delivering) _context->handler(self, &*message);
}

std::shared_ptr<void> UnixPeerConnection::holdBarriers() {
  _context->mainThread.check("UnixPeerConnection");
  if (auto hold = _barrierHold.lock()) return hold;
  const auto letGo = [peer = weak_from_this()](void*) {
    const auto self = peer.lock();
    if (!self) return;
    try {
      self->_answerHeldBarriers();
    } catch (const std::exception& exception) {
      // Nothing may pass whoever lets go. The end of the connection says that there is no answer.
      self->_context->log.warning(self->_name() + " is disconnected: " + exception.what());
      self->_close();
    }
  };
  std::shared_ptr<void> hold(this, letGo);  // nobody looks at what it points to
  _barrierHold = hold;
  return hold;
}

void UnixPeerConnection::_takeBarrier(std::uint64_t cookie) {
  const MainThreadWatch::Span span("barrier");
  if (_barrierHold.expired()) return _answerBarrier(cookie);
  _heldBarriers.push_back(cookie);
  if (_heldBarriers.size() * kFrameHeaderSize <= _context->settings.maximumReplyBacklog) return;
  _context->log.warning(_name() + " sends barriers without waiting for their answers; it is disconnected");
  _becomeInvalid();
}

void UnixPeerConnection::_answerHeldBarriers() {
  for (const std::uint64_t cookie : std::exchange(_heldBarriers, {})) {
    if (_socket && !_finished) _answerBarrier(cookie);
  }
  if (_saidAll) _becomeInvalid();
}

void UnixPeerConnection::_answerBarrier(std::uint64_t cookie) {
  if (_context->confirm) _context->confirm();
  _context->showShares();
  FrameHeader passed;
  passed.kind = FrameKind::barrierPassed;
  passed.cookie = cookie;
  _queue(passed, {});
}

void UnixPeerConnection::_skipFrame() {
  if (++_skippedFrames == 1) {
    _context->log.warning(_name() + " sent a frame that is no request; it and others like it are skipped");
  }
  deliverError(IpcError::connectionInterrupted);
}

bool UnixPeerConnection::sendReply(std::uint64_t replyToken, const ValueMap& reply) {
  _context->mainThread.check("UnixPeerConnection");
  if (!_socket || _finished) return false;
  FrameHeader header;
  header.kind = FrameKind::reply;
  header.cookie = replyToken;
  _queue(header, encodeDictionary(reply));
  return isConnected();
}

void UnixPeerConnection::_queue(const FrameHeader& header, std::string_view payload) {
  appendFrame(_backlog, header, payload);
  if (!_awaitingOutput) _sendBacklog();
  if (_socket && _backlog.size() - _sent > _context->settings.maximumReplyBacklog) {
    _context->log.warning(_name() + " does not read its replies; it is disconnected");
    _close();
    // The handler hears of it on a turn of its own: it may be the one that is replying.
    asio::post(_context->io, [self = shared_from_this()] { self->_becomeInvalid(); });
  }
}

void UnixPeerConnection::_sendBacklog() {
  while (_sent < _backlog.size()) {
    const auto sent = ::send(_socket->native_handle(), _backlog.data() + _sent, _backlog.size() - _sent,
                             MSG_DONTWAIT | MSG_NOSIGNAL);
    if (sent >= 0) {
      _sent += static_cast<std::size_t>(sent);
    } else if (isRetryLater(errno)) {
      return _awaitOutput();
    } else if (errno != EINTR) {
      // The peer is gone; reading will find what it still sent, and then the end. Or the kernel has no room
      // for an answer: the peer sees the end instead of waiting for it.
      ::shutdown(_socket->native_handle(), SHUT_WR);
      break;
    }
  }
  std::string().swap(_backlog);
  _sent = 0;
}

void UnixPeerConnection::_awaitOutput() {
  _backlog.erase(0, std::exchange(_sent, 0));
  _awaitingOutput = true;
  _socket->async_wait(descriptor_base::wait_write, [self = shared_from_this()](const std::error_code& error) {
    self->_awaitingOutput = false;
    if (!error && self->_socket) self->_sendBacklog();
  });
}

void UnixPeerConnection::_becomeInvalid() {
  if (std::exchange(_finished, true)) return;
  const auto keptAlive = shared_from_this();
  _close();
  if (_skippedFrames > 1) {
    _context->log.log("IPC", _name() + ": " + std::to_string(_skippedFrames) + " frames were skipped");
  }
  _deliver(IpcError::connectionInvalid);
}

void UnixPeerConnection::cancel() {
  _context->mainThread.check("UnixPeerConnection");
  _finished = true;
  _close();
}

void UnixPeerConnection::_close() {
  const auto keptAlive = shared_from_this();
  _context->peers.erase(keptAlive);
  _socket.reset();
  _waiting.reset();
  std::string().swap(_backlog);
  _sent = 0;
}

std::string UnixPeerConnection::_name() const {
  return "peer(" + std::to_string(_credentials.process) + ") of user " + std::to_string(_credentials.user);
}

}  // namespace zal
