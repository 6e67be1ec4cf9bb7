#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <asio/posix/stream_descriptor.hpp>
#include <asio/steady_timer.hpp>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/ipc/access_policy.h"
#include "platform/linux/ipc/client_shares.h"
#include "platform/linux/ipc/ipc_context.h"
#include "platform/linux/wire/frame_decoder.h"

namespace zal {

/// One accepted client. Reads and decodes, hands events to the context's handler, answers barriers,
/// sends replies. What a handler throws passes through to the loop. Main thread only.
///
/// At most one read of the shared buffer's size a turn: a client that fills it goes to the back of
/// the loop's queue, one that does not has been drained. A client that has more than its share of the
/// agent's memory waits until there is room again, or a second for each such read.
class UnixPeerConnection final : public PeerConnection,
                                 public std::enable_shared_from_this<UnixPeerConnection> {
 public:
  UnixPeerConnection(std::shared_ptr<IpcContext> context, Descriptor socket,
                     const PeerCredentials& credentials);

  /// Begins to deliver; called once, after it is owned by a shared pointer.
  void start();
  /// Delivers an error that does not end the connection.
  void deliverError(IpcError error);
  [[nodiscard]] ClientShare share() const;

  [[nodiscard]] pid_t processId() const override { return _credentials.process; }
  [[nodiscard]] bool isConnected() const override { return _socket.has_value(); }
  bool sendReply(std::uint64_t replyToken, const ValueMap& reply) override;
  [[nodiscard]] std::shared_ptr<void> holdBarriers() override;
  void cancel() override;

 private:
  void _deliver(const IpcEvent& event);
  void _awaitInput();
  void _awaitTurn(bool hasMore);
  [[nodiscard]] bool _hasTooMuch() const;
  void _awaitMemory();
  void _endWaiting();
  void _readTurn();
  void _writeOutWhatCameAlone(std::size_t size);
  void _takeFrames(const std::shared_ptr<PeerConnection>& self);
  void _takeFrame(const std::shared_ptr<PeerConnection>& self, const Frame& frame);
  void _takeMessage(const std::shared_ptr<PeerConnection>& self, const Frame& frame);
  void _skipFrame();
  void _takeBarrier(std::uint64_t cookie);
  void _answerBarrier(std::uint64_t cookie);
  void _answerHeldBarriers();
  void _queue(const FrameHeader& header, std::string_view payload);
  void _sendBacklog();
  void _awaitOutput();
  void _becomeInvalid();
  void _close();
  [[nodiscard]] std::string _name() const;

  std::shared_ptr<IpcContext> _context;
  std::optional<asio::posix::stream_descriptor> _socket;  // none: closed
  const PeerCredentials _credentials;
  FrameDecoder _decoder;
  std::string _backlog;  // answers, of which the first _sent bytes are gone
  std::size_t _sent = 0;
  std::weak_ptr<void> _barrierHold;          // barriers wait for its end
  std::vector<std::uint64_t> _heldBarriers;  // their cookies
  bool _saidAll = false;                     // before they were answered
  bool _awaitingOutput = false;
  bool _finished = false;  // no event is delivered any more
  const std::shared_ptr<MemoryAccount> _account = std::make_shared<MemoryAccount>();
  std::optional<asio::steady_timer> _waiting;  // for memory, not for the peer
  bool _hearsOfMemory = false;
  bool _isDelayed = false;  // what comes with the next read had to wait
  std::uint64_t _delayedMessages = 0;
  std::uint64_t _skippedFrames = 0;
};

}  // namespace zal
