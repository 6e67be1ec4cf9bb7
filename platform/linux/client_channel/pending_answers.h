#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>

#include "platform/client_channel.h"

namespace zal {

/// What a client still waits for, by the cookie that the agent repeats: barriers and replies. The
/// owner's lock guards it.
class PendingAnswers {
 public:
  /// What had been accepted when the question was: `frames` includes the question's own.
  struct Position {
    std::uint64_t frames = 0;
    std::uint64_t requests = 0;
  };

  /// Returned: the cookie, never 0 and never used before.
  std::uint64_t openBarrier(Position position) { return _open(true, position); }
  std::uint64_t openReply(Position position) { return _open(false, position); }
  [[nodiscard]] std::size_t openReplies() const { return _openReplies; }

  /// Returned: how many requests that confirms; nothing when nobody waits any more.
  std::optional<std::uint64_t> barrierPassed(std::uint64_t cookie);
  /// No dictionary: the reply came and could not be read, which counts as lost.
  void replied(std::uint64_t cookie, std::optional<ValueMap> reply);
  /// Whatever was asked within the first `writtenFrames` and is unanswered will never be.
  void connectionLost(std::uint64_t writtenFrames);
  [[nodiscard]] std::uint64_t lastCookie() const { return _lastCookie; }
  /// Nobody to connect to, when somebody looked after that question was asked: barriers up to it give up,
  /// replies may still come later.
  void unreachable(std::uint64_t lastCookie);
  /// The frame of this cookie was not accepted after all.
  void forget(std::uint64_t cookie);

  /// The outcome once there is one; unknown cookies are lost.
  [[nodiscard]] std::optional<ClientOutcome> outcome(std::uint64_t cookie) const;
  /// Forgets the question and hands over its reply, if it was one.
  ValueMap take(std::uint64_t cookie);

 private:
  struct Question {
    bool isBarrier = false;
    Position position;
    std::optional<ClientOutcome> outcome;
    ValueMap reply;
  };
  std::uint64_t _open(bool isBarrier, Position position);

  std::map<std::uint64_t, Question> _questions;
  std::size_t _openReplies = 0;
  std::uint64_t _lastCookie = 0;
};

}  // namespace zal
