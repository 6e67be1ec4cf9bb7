#include "platform/linux/client_channel/pending_answers.h"

#include <utility>

namespace zal {

std::uint64_t PendingAnswers::_open(bool isBarrier, Position position) {
  _questions.emplace(++_lastCookie, Question{isBarrier, position, std::nullopt, {}});
  if (!isBarrier) ++_openReplies;
  return _lastCookie;
}

std::optional<std::uint64_t> PendingAnswers::barrierPassed(std::uint64_t cookie) {
  const auto found = _questions.find(cookie);
  if (found == _questions.end() || !found->second.isBarrier) return std::nullopt;
  if (!found->second.outcome) found->second.outcome = ClientOutcome::done;
  return found->second.position.requests;
}

void PendingAnswers::replied(std::uint64_t cookie, std::optional<ValueMap> reply) {
  const auto found = _questions.find(cookie);
  if (found == _questions.end() || found->second.isBarrier || found->second.outcome) return;
  found->second.outcome = reply ? ClientOutcome::done : ClientOutcome::lost;
  if (reply) found->second.reply = std::move(*reply);
}

void PendingAnswers::connectionLost(std::uint64_t writtenFrames) {
  for (auto& [cookie, question] : _questions) {
    if (question.position.frames <= writtenFrames && !question.outcome)
      question.outcome = ClientOutcome::lost;
  }
}

void PendingAnswers::unreachable(std::uint64_t lastCookie) {
  for (auto& [cookie, question] : _questions) {
    if (cookie > lastCookie) return;
    if (question.isBarrier && !question.outcome) question.outcome = ClientOutcome::unreachable;
  }
}

void PendingAnswers::forget(std::uint64_t cookie) {
  const auto found = _questions.find(cookie);
  if (found == _questions.end()) return;
  if (!found->second.isBarrier) --_openReplies;
  _questions.erase(found);
}

std::optional<ClientOutcome> PendingAnswers::outcome(std::uint64_t cookie) const {
  const auto found = _questions.find(cookie);
  return found == _questions.end() ? ClientOutcome::lost : found->second.outcome;
}

ValueMap PendingAnswers::take(std::uint64_t cookie) {
  const auto found = _questions.find(cookie);
  if (found == _questions.end()) return {};
  ValueMap reply = std::move(found->second.reply);
  forget(cookie);
  return reply;
}

}  // namespace zal
