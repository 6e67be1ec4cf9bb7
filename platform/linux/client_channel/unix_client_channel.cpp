#include "platform/linux/client_channel/unix_client_channel.h"

#include <csignal>

#include "platform/linux/client_channel/request_encoder.h"

namespace zal {
namespace {

/// Room above the limit for the barriers of callers who wait while the queue is full.
constexpr std::size_t kBarrierRoom = 64U << 10U;

}  // namespace

UnixClientChannel::UnixClientChannel(ClientChannelOptions options)
    : _options(std::move(options)), _retry(_options.firstRetry, _options.longestRetry) {
  // The program's signals are for the program's threads.
  sigset_t all;
  sigset_t before;
  ::sigfillset(&all);
  ::pthread_sigmask(SIG_SETMASK, &all, &before);
  try {
    _thread = std::thread([this] { _run(); });
  } catch (...) {
    ::pthread_sigmask(SIG_SETMASK, &before, nullptr);
    throw;
  }
  ::pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

UnixClientChannel::~UnixClientChannel() {
  {
    const Lock lock(_mutex);
    _stop = true;
  }
  _wakeUp.wake();
  _thread.join();
}

ClientOutcome UnixClientChannel::send(std::span<const RequestField> fields) {
  const auto frame = encodeRequest(fields, FrameKind::message, 0, _options.largestRequest);
  Lock lock(_mutex);
  return _append(frame, lock);
}

ClientOutcome UnixClientChannel::ask(std::span<const RequestField> fields, std::uint64_t& token) {
  Lock lock(_mutex);
  token = 0;
  if (_ledger.openReplies() >= kMostAsked) {
    _ledger.noteDropped();
    return ClientOutcome::dropped;
  }
  // Encoded under the lock, as the cookie stands for the request's place in the queue. Asking is rare.
  const std::uint64_t cookie = _ledger.openReply();
  const auto frame = encodeRequest(fields, FrameKind::messageExpectingReply, cookie, _options.largestRequest);
  const ClientOutcome outcome = _append(frame, lock);
  if (outcome == ClientOutcome::done) {
    token = cookie;
  } else {
    _ledger.forget(cookie);
  }
  return outcome;
}

/// Nothing stands for a request that was too large to encode. Unlocks when it accepts.
ClientOutcome UnixClientChannel::_append(std::optional<std::string_view> frame, Lock& lock) {
  const bool fits = frame && frame->size() <= _options.queueLimit;
  if (!fits || _queuedBytes() + frame->size() > _options.queueLimit) {
    // A report of what was dropped comes again.
    if (std::this_thread::get_id() != _ownThread) _ledger.noteDropped();
    return fits ? ClientOutcome::dropped : ClientOutcome::tooLarge;
  }
  _queue.append(*frame, true);
  _ledger.noteAccepted();
  const bool wake = _queue.unwritten().size() >= _wakeAt;
  if (wake) _wakeAt = kNever;
  lock.unlock();
  if (wake) _wakeUp.wake();
  return ClientOutcome::done;
}

ClientOutcome UnixClientChannel::flush(std::chrono::milliseconds limit) {
  const auto deadline = std::chrono::steady_clock::now() + limit;
  Lock lock(_mutex);
  if (_queuedBytes() > _options.queueLimit + kBarrierRoom) return ClientOutcome::timedOut;
  const DeliveryLedger::Flush flush = _ledger.openFlush();
  _queue.append(encodeBarrier(flush.cookie), false);
  _hurry = true;
  _wakeUp.wake();
  _answered.wait_until(lock, deadline, [&] { return _ledger.outcome(flush.cookie).has_value(); });
  return _ledger.closeFlush(flush);
}

ClientOutcome UnixClientChannel::awaitReply(std::uint64_t token, std::chrono::milliseconds limit,
                                            ValueMap& reply) {
  const auto deadline = std::chrono::steady_clock::now() + limit;
  Lock lock(_mutex);
  const auto isAnswered = [&] { return _ledger.outcome(token).has_value(); };
  if (!_answered.wait_until(lock, deadline, isAnswered)) return ClientOutcome::timedOut;
  const ClientOutcome outcome = *_ledger.outcome(token);
  reply = _ledger.takeReply(token);
  return outcome;
}

ClientChannelStatus UnixClientChannel::status() const {
  const Lock lock(_mutex);
  return _ledger.status(_queuedBytes());
}

double UnixClientChannel::now() const {
  return std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count();
}

}  // namespace zal
