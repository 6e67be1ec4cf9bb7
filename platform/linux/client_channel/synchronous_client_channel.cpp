#include "platform/linux/client_channel/synchronous_client_channel.h"

#include <poll.h>

#include <algorithm>
#include <thread>
#include <utility>

#include "platform/linux/client_channel/request_encoder.h"

namespace zal {
namespace {

using std::chrono::steady_clock;
using namespace std::chrono_literals;

constexpr auto kBusyRetry = 5ms;

/// False when the deadline came first.
bool waitFor(int descriptor, short events, steady_clock::time_point deadline) {
  pollfd wanted{descriptor, events, 0};
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - steady_clock::now());
  return ::poll(&wanted, 1, static_cast<int>(std::max<std::chrono::milliseconds::rep>(left.count(), 0))) > 0;
}

}  // namespace

SynchronousClientChannel::SynchronousClientChannel(ClientChannelOptions options)
    : _options(std::move(options)), _retry(_options.firstRetry, _options.longestRetry) {}

ClientOutcome SynchronousClientChannel::send(std::span<const RequestField> fields) {
  const auto frame = encodeRequest(fields, FrameKind::message, 0, _options.largestRequest);
  const std::lock_guard lock(_mutex);
  if (frame) return _sendRequest(*frame);
  _ledger.noteDropped();
  return ClientOutcome::tooLarge;
}

ClientOutcome SynchronousClientChannel::ask(std::span<const RequestField> fields, std::uint64_t& token) {
  const std::lock_guard lock(_mutex);
  token = 0;
  if (_ledger.openReplies() >= kMostAsked) {
    _ledger.noteDropped();
    return ClientOutcome::dropped;
  }
  const std::uint64_t cookie = _ledger.openReply();
  const auto frame = encodeRequest(fields, FrameKind::messageExpectingReply, cookie, _options.largestRequest);
  ClientOutcome outcome = ClientOutcome::tooLarge;
  if (frame) {
    outcome = _sendRequest(*frame);
  } else {
    _ledger.noteDropped();
  }
  if (outcome == ClientOutcome::done) {
    token = cookie;
  } else {
    _ledger.forget(cookie);
  }
  return outcome;
}

ClientOutcome SynchronousClientChannel::flush(std::chrono::milliseconds limit) {
  const auto deadline = steady_clock::now() + limit;
  const std::lock_guard lock(_mutex);
  const DeliveryLedger::Flush flush = _ledger.openFlush();
  const ClientOutcome sent = _writeFrame(encodeBarrier(flush.cookie), deadline, true);
  _ledger.noteWritten({1, 0});
  if (sent == ClientOutcome::done) _readUntilAnswered(flush.cookie, deadline);
  const ClientOutcome outcome = _ledger.closeFlush(flush);
  return sent == ClientOutcome::unreachable && outcome == ClientOutcome::timedOut ? sent : outcome;
}

ClientOutcome SynchronousClientChannel::awaitReply(std::uint64_t token, std::chrono::milliseconds limit,
                                                   ValueMap& reply) {
  const std::lock_guard lock(_mutex);
  _readUntilAnswered(token, steady_clock::now() + limit);
  const auto outcome = _ledger.outcome(token);
  if (!outcome) return ClientOutcome::timedOut;
  reply = _ledger.takeReply(token);
  return *outcome;
}

ClientChannelStatus SynchronousClientChannel::status() const {
  const std::lock_guard lock(_mutex);
  return _ledger.status(0);
}

double SynchronousClientChannel::now() const {
  return std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count();
}

ClientOutcome SynchronousClientChannel::_sendRequest(std::string_view frame) {
  const ClientOutcome outcome = _writeFrame(frame, steady_clock::now() + _options.writeLimit, false);
  if (outcome != ClientOutcome::done) {
    _ledger.noteDropped();
    return outcome == ClientOutcome::timedOut ? ClientOutcome::dropped : outcome;
  }
  _ledger.noteAccepted();
  _ledger.noteWritten({1, 1});
  return ClientOutcome::done;
}

ClientOutcome SynchronousClientChannel::_writeFrame(std::string_view frame, Moment deadline, bool atOnce) {
  // A connection that broke while nobody looked shows at the next write only: one more try.
  for (int attempt = 0; attempt < 2; ++attempt) {
    if (!_socket.isOpen() && !_connect(deadline, atOnce || attempt != 0)) return ClientOutcome::unreachable;
    switch (_writeWhole(frame, deadline)) {
      case Written::whole:
        return ClientOutcome::done;
      case Written::late:
        // Part of the frame may be on its way; nothing can follow it on this stream.
        _loseConnection("the agent did not read in time");
        return ClientOutcome::timedOut;
      case Written::broken:
        // Answers that arrived before the break still count.
        (void)_socket.read([this](const Frame& answer) { _ledger.noteAnswer(answer); });
        _loseConnection(_socket.trouble());
    }
  }
  return ClientOutcome::unreachable;
}

SynchronousClientChannel::Written SynchronousClientChannel::_writeWhole(std::string_view frame,
                                                                        Moment deadline) {
  while (!frame.empty()) {
    const auto taken = _socket.write(frame);
    if (!taken) return Written::broken;
    if (*taken != 0) _ledger.noteWrite(*taken);
    frame.remove_prefix(*taken);
    if (*taken == 0 && !waitFor(_socket.descriptor(), POLLOUT, deadline)) return Written::late;
  }
  return Written::whole;
}

bool SynchronousClientChannel::_connect(Moment deadline, bool atOnce) {
  if (!atOnce && !_retry.isDue(steady_clock::now())) return false;
  AgentSocket::Attempt attempt = _socket.connect(_options.address);
  while (attempt == AgentSocket::Attempt::busy && steady_clock::now() < deadline) {
    std::this_thread::sleep_for(kBusyRetry);
    attempt = _socket.connect(_options.address);
  }
  if (attempt == AgentSocket::Attempt::connected) {
    _retry.worked();
    _ledger.noteConnected(_socket.agent());
    return true;
  }
  _retry.failed(steady_clock::now());
  _ledger.noteRefused(_socket.trouble(), attempt == AgentSocket::Attempt::busy, _ledger.lastQuestion());
  return false;
}

void SynchronousClientChannel::_readUntilAnswered(std::uint64_t cookie, Moment deadline) {
  while (!_ledger.outcome(cookie)) {
    if (!_socket.isOpen() || !waitFor(_socket.descriptor(), POLLIN, deadline)) return;
    if (!_socket.read([this](const Frame& answer) { _ledger.noteAnswer(answer); })) {
      _loseConnection(_socket.trouble());
    }
  }
}

void SynchronousClientChannel::_loseConnection(const std::string& trouble) {
  _socket.close();
  _ledger.noteConnectionLost(trouble);
}

}  // namespace zal
