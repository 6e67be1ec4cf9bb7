#include "session/session_writings.h"

#include <utility>

namespace zal {

SessionWritings::SessionWritings(RunLoop& loop, WorkQueues& queues)
    : _loop(loop), _queue(queues.makeSerial("session.logs")) {}

void SessionWritings::begin(const std::shared_ptr<SessionLogWriting>& writing, Finish finish) {
  ++_begun;
  _pending->push_back({writing, std::move(finish)});
  _queue->async([this, &loop = _loop, writing, alive = std::weak_ptr(_pending)] {
    writing->run();
    loop.post([this, writing, alive] {
      const auto pending = alive.lock();
      // finishAll() may have been here already.
      while (pending && !pending->empty() && pending->front().writing == writing) _finishFirst();
    });
  });
}

void SessionWritings::keepUntilFinished(std::shared_ptr<void> kept) {
  if (!_pending->empty()) _pending->back().kept.push_back(std::move(kept));
}

void SessionWritings::finishAll() {
  while (!_pending->empty()) _finishFirst();
}

void SessionWritings::_finishFirst() {
  const Pending first = std::move(_pending->front());
  _pending->pop_front();
  const std::size_t begun = _begun;
  first.finish(first.writing->run());
  // What follows from it belongs to it.
  if (_begun == begun) return;
  for (const auto& kept : first.kept) keepUntilFinished(kept);
}

}  // namespace zal
