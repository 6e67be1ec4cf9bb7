#include "platform/linux/client_channel/delivery_ledger.h"

#include <algorithm>
#include <utility>

#include "platform/linux/client_channel/reply_decoder.h"

namespace zal {

void DeliveryLedger::noteAccepted() {
  ++_accepted.frames;
  ++_accepted.requests;
}

void DeliveryLedger::noteWritten(FrameBatch::Count count) {
  _written.frames += count.frames;
  _written.requests += count.requests;
}

void DeliveryLedger::noteConnected(pid_t agent) {
  _status.connected = true;
  _status.agent = agent;
  ++_status.connections;
}

void DeliveryLedger::noteRefused(const std::string& trouble, bool somebodyIsThere,
                                 std::uint64_t lastQuestion) {
  _status.trouble = trouble;
  if (!somebodyIsThere) _answers.unreachable(lastQuestion);
}

void DeliveryLedger::noteConnectionLost(const std::string& trouble) {
  _status.connected = false;
  _status.agent = 0;
  _status.trouble = trouble;
  _answers.connectionLost(_written.frames);
  if (_written.requests <= _confirmed) return;
  _status.unconfirmed += _written.requests - _confirmed;
  _confirmed = _written.requests;
  ++_losses;
  _lossUntold = true;
}

void DeliveryLedger::noteAnswer(const Frame& frame) {
  if (frame.header.kind == FrameKind::reply) {
    _answers.replied(frame.header.cookie, decodeReply(frame.payload));
  } else if (frame.header.kind == FrameKind::barrierPassed) {
    _confirmed = std::max(_confirmed, _answers.barrierPassed(frame.header.cookie).value_or(0));
  }
}

std::uint64_t DeliveryLedger::openReply() {
  return _answers.openReply({_accepted.frames + 1, _accepted.requests + 1});
}

DeliveryLedger::Flush DeliveryLedger::openFlush() {
  ++_accepted.frames;
  return {_answers.openBarrier(_accepted), _losses, _lossUntold};
}

ClientOutcome DeliveryLedger::closeFlush(const Flush& flush) {
  ClientOutcome outcome = _answers.outcome(flush.cookie).value_or(ClientOutcome::timedOut);
  _answers.forget(flush.cookie);
  const bool lost = flush.lossUntold || _losses != flush.losses;
  if (outcome == ClientOutcome::done && lost) outcome = ClientOutcome::lost;
  if (outcome == ClientOutcome::done || outcome == ClientOutcome::lost) _lossUntold = false;
  return outcome;
}

ClientChannelStatus DeliveryLedger::status(std::size_t queuedBytes) const {
  ClientChannelStatus status = _status;
  status.queuedBytes = queuedBytes;
  status.sent = _written.requests;
  return status;
}

}  // namespace zal
