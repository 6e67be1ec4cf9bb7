#include "platform/linux/ping/echo_run.h"

#include <algorithm>
#include <utility>

#include "platform/linux/ping/ping_report.h"
#include "platform/linux/ping/ping_text.h"

namespace zal {
namespace {

// So that a storm of answers does not keep the loop from its other work.
constexpr int kEventsAtOnce = 64;

}  // namespace

EchoRun::EchoRun(asio::io_context& context, EchoSocket socket, std::chrono::nanoseconds duration,
                 std::shared_ptr<PingReport> report, std::function<void()> onEnd)
    : _socket(std::move(socket)),
      _readiness(context, _socket.descriptor()),
      _timer(context),
      _report(std::move(report)),
      _onEnd(std::move(onEnd)),
      _duration(duration) {}

EchoRun::~EchoRun() {
  if (_readiness.is_open()) _readiness.release();
}

void EchoRun::start() {
  _started = std::chrono::steady_clock::now();
  _timer.expires_at(_started);
  _waitForEvents();
  _sendNext();
}

void EchoRun::stop() {
  const auto onEnd = std::exchange(_onEnd, nullptr);
  if (!onEnd) return;
  _timer.cancel();
  _takeEvents();  // what arrived in this very turn counts
  _readiness.release();
  onEnd();
}

std::chrono::milliseconds EchoRun::_elapsed() const {
  return std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - _started);
}

bool EchoRun::_hasNothingToWaitFor() const {
  return _unanswered == 0 && _timer.expiry() >= _started + _duration;
}

void EchoRun::_sendNext() {
  ++_sequence;
  ++_unanswered;
  _requests[_sequence] = {std::chrono::steady_clock::now(), false};
  const std::error_code error = _socket.send(_sequence);
  // A refused request counts as sent and lost: the interval without it would look like a good one.
  _report->updateStatistics([&](PingStatistics& statistics) {
    ++statistics.transmitted;
    statistics.elapsed = _elapsed();
    if (error) ++statistics.errors;
  });
  if (error) _report->addLine("ping: icmp_seq=" + std::to_string(_sequence) + " send: " + error.message());
  _timer.expires_at(_timer.expiry() + kInterval);
  _timer.async_wait([self = shared_from_this()](const std::error_code& cancelled) {
    if (!cancelled && self->_onEnd) self->_sendNext();
  });
}

void EchoRun::_waitForEvents() {
  _readiness.async_wait(asio::posix::stream_descriptor::wait_read,
                        [self = shared_from_this()](const std::error_code& cancelled) {
                          if (cancelled || !self->_onEnd) return;
                          self->_takeEvents();
                          if (self->_hasNothingToWaitFor()) {
                            self->stop();
                          } else {
                            self->_waitForEvents();
                          }
                        });
}

void EchoRun::_takeEvents() {
  for (int i = 0; i < kEventsAtOnce; ++i) {
    const auto event = _socket.receive();
    if (!event) return;
    std::visit([this](const auto& what) { _take(what); }, *event);
  }
}

void EchoRun::_take(const EchoAnswer& answer) {
  const auto found = _requests.find(answer.sequence);
  if (found == _requests.end()) return;
  Request& request = found->second;
  // The loop may have been busy when the answer came: what it lay waiting is not the network's.
  const std::chrono::nanoseconds whole = std::chrono::steady_clock::now() - request.sent;
  const auto waited = std::clamp(answer.waited, std::chrono::nanoseconds{0}, whole);
  const auto roundTrip = std::chrono::duration_cast<std::chrono::microseconds>(whole - waited);
  const bool duplicate = std::exchange(request.answered, true);
  if (!duplicate) --_unanswered;
  _report->updateStatistics([&](PingStatistics& statistics) {
    statistics.elapsed = _elapsed();
    if (duplicate) {
      ++statistics.duplicates;
    } else {
      statistics.addAnswer(roundTrip);
    }
  });
  _report->addLine(answerText(
      {answer.bytes, answer.from.to_string(), answer.sequence, answer.hops, roundTrip, duplicate}));
}

void EchoRun::_take(const EchoRefusal& refusal) {
  _report->updateStatistics([&](PingStatistics& statistics) {
    ++statistics.errors;
    statistics.elapsed = _elapsed();
  });
  _report->addLine("From " + refusal.from.to_string() + " icmp_seq=" + std::to_string(refusal.sequence) +
                   " " + refusal.text);
}

}  // namespace zal
