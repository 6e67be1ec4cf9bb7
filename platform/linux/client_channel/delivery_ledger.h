#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/client_channel.h"
#include "platform/linux/client_channel/frame_batch.h"
#include "platform/linux/client_channel/pending_answers.h"
#include "platform/linux/wire/frame_decoder.h"

namespace zal {

/// What a channel knows of the requests it was given: accepted, written, confirmed by a barrier,
/// gone down with a connection; and the answers still awaited. The owner's lock guards it.
///
///     accepted ≥ written ≥ confirmed
///
/// What was written and not confirmed when a connection breaks may never have been read; the next
/// flush has to say so.
class DeliveryLedger {
 public:
  void noteAccepted();
  void noteDropped() { ++_status.dropped; }
  void noteWrite(std::size_t bytes) {
    ++_status.writes;
    _status.sentBytes += bytes;
  }
  void noteWritten(FrameBatch::Count count);

  void noteConnected(pid_t agent);
  /// Before an attempt to connect: what it finds says nothing about questions that are asked later.
  [[nodiscard]] std::uint64_t lastQuestion() const { return _answers.lastCookie(); }
  void noteRefused(const std::string& trouble, bool somebodyIsThere, std::uint64_t lastQuestion);
  void noteConnectionLost(const std::string& trouble);
  void noteAnswer(const Frame& frame);

  /// The reply's question comes before its request is accepted; undone by forget().
  std::uint64_t openReply();
  [[nodiscard]] std::size_t openReplies() const { return _answers.openReplies(); }
  void forget(std::uint64_t cookie) { _answers.forget(cookie); }
  [[nodiscard]] std::optional<ClientOutcome> outcome(std::uint64_t cookie) const {
    return _answers.outcome(cookie);
  }
  ValueMap takeReply(std::uint64_t cookie) { return _answers.take(cookie); }

  struct Flush {
    std::uint64_t cookie = 0;
    std::uint64_t losses = 0;
    bool lossUntold = false;
  };
  /// The barrier counts as accepted.
  [[nodiscard]] Flush openFlush();
  /// What the caller of flush() is told; timedOut when no answer has come.
  ClientOutcome closeFlush(const Flush& flush);

  [[nodiscard]] ClientChannelStatus status(std::size_t queuedBytes) const;
  [[nodiscard]] std::uint64_t dropped() const { return _status.dropped; }

 private:
  PendingAnswers _answers;
  PendingAnswers::Position _accepted;
  PendingAnswers::Position _written;
  std::uint64_t _confirmed = 0;  // requests
  std::uint64_t _losses = 0;     // connections that took unconfirmed requests with them
  bool _lossUntold = false;      // no flush has told of the last of them
  ClientChannelStatus _status;
};

}  // namespace zal
