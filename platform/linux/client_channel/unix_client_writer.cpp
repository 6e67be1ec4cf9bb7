// The channel's own thread: from the queue to the socket, and back with the answers.

#include <poll.h>
#include <pthread.h>

#include <algorithm>
#include <array>
#include <utility>

#include "platform/linux/client_channel/unix_client_channel.h"

namespace zal {
namespace {

using std::chrono::steady_clock;
using namespace std::chrono_literals;

/// An agent that is there but busy taking in others is asked again soon.
constexpr auto kFullSocketRetry = 5ms;
/// A connection that lived this long was a good one.
constexpr auto kGoodConnection = 1s;
/// While requests are dropped all the time the agent's log is told this often.
constexpr auto kReportInterval = 1s;

}  // namespace

void UnixClientChannel::_run() {
  ::pthread_setname_np(::pthread_self(), "lirra");
  {
    const Lock lock(_mutex);
    _ownThread = std::this_thread::get_id();
  }
  while (_takeWork()) {
    if (!_batch.isEmpty()) {
      if (!_socket.isOpen()) _connectWhenDue();
      if (_socket.isOpen()) _write();
    }
    _sleep();
  }
}

/// False when it is time to stop.
bool UnixClientChannel::_takeWork() {
  const Lock lock(_mutex);
  if (_batch.isEmpty() && !_queue.isEmpty()) {
    _batch.swap(_queue);
    _batchBytes = _batch.unwritten().size();
    if (_socket.isOpen()) _hurry = false;
  }
  return !_stop;
}

void UnixClientChannel::_connectWhenDue() {
  std::uint64_t lastQuestion = 0;
  {
    const Lock lock(_mutex);
    if (!std::exchange(_hurry, false) && !_retry.isDue(steady_clock::now())) return;
    lastQuestion = _ledger.lastQuestion();
  }
  const AgentSocket::Attempt attempt = _socket.connect(_options.address);
  const auto now = steady_clock::now();
  const Lock lock(_mutex);
  if (attempt == AgentSocket::Attempt::connected) {
    _connectedAt = now;
    _ledger.noteConnected(_socket.agent());
    return;
  }
  const bool busy = attempt == AgentSocket::Attempt::busy;
  if (busy) {
    _retry.postpone(now + kFullSocketRetry);
  } else {
    _retry.failed(now);
  }
  _ledger.noteRefused(_socket.trouble(), busy, lastQuestion);
  _answered.notify_all();
}

void UnixClientChannel::_write() {
  bool broken = false;
  while (!_batch.isEmpty() && !broken) {
    const auto taken = _socket.write(_batch.unwritten());
    broken = !taken;
    if (taken && *taken == 0) break;
    if (taken) _batch.advance(*taken);

    const Lock lock(_mutex);
    _batchBytes = _batch.unwritten().size();
    if (taken) _ledger.noteWrite(*taken);
    if (_batchBytes != 0) continue;
    _ledger.noteWritten(_batch.count());
    _batch.clear();
  }
  _lastWrite = steady_clock::now();
  if (broken) {
    _read();  // what the agent had answered before it went away
    if (_socket.isOpen()) _loseConnection();
  } else {
    _reportDropped();
  }
}

void UnixClientChannel::_read() {
  const bool alive = _socket.read([this](const Frame& frame) { _handle(frame); });
  if (!alive) _loseConnection();
}

void UnixClientChannel::_handle(const Frame& frame) {
  _retry.worked();
  const Lock lock(_mutex);
  _ledger.noteAnswer(frame);
  _answered.notify_all();
}

void UnixClientChannel::_loseConnection() {
  _socket.close();
  const auto now = steady_clock::now();
  if (now - _connectedAt >= kGoodConnection) _retry.worked();
  _retry.failed(now);

  const Lock lock(_mutex);
  _ledger.noteWritten(_batch.forgetWritten());
  _batchBytes = _batch.unwritten().size();
  _ledger.noteConnectionLost(_socket.trouble());
  _answered.notify_all();
}

void UnixClientChannel::_reportDropped() {
  std::uint64_t dropped = 0;
  {
    const Lock lock(_mutex);
    dropped = _ledger.dropped() - _dropsReported;
    if (dropped == 0 || _queuedBytes() > _options.queueLimit / 2) return;
    if (_queuedBytes() != 0 && steady_clock::now() - _lastReport < kReportInterval) return;
  }
  if (!_options.roomAgain) return;
  _lastReport = steady_clock::now();
  if (!_options.roomAgain(*this, dropped)) return;
  const Lock lock(_mutex);
  _dropsReported += dropped;
}

UnixClientChannel::Sleep UnixClientChannel::_planSleep() {
  if (_stop) return {false, 0ns};
  const auto now = steady_clock::now();
  const auto paused = now - _lastWrite;
  const bool nothing = _batch.isEmpty() && _queue.isEmpty();
  if (nothing && (!_socket.isOpen() || paused >= kPause)) {
    _wakeAt = 1;
    _queue.trim();
    _batch.trim();
    return {};
  }
  if (!_socket.isOpen()) {
    if (_hurry) return {false, 0ns};
    return {false, std::max<std::chrono::nanoseconds>(_retry.due() - now, 0ns)};
  }
  if (!_batch.isEmpty()) return {true};  // the agent is slow to read
  if (_hurry || _queue.unwritten().size() >= kLargeWrite || paused >= kPause) return {false, 0ns};
  // Empty or not: whoever has just sent something is likely to send more.
  _wakeAt = kLargeWrite;
  return {false, kPause - paused};
}

/// Returns when there may be something to do; answers that arrive meanwhile are handled.
void UnixClientChannel::_sleep() {
  Sleep sleep;
  {
    const Lock lock(_mutex);
    sleep = _planSleep();
  }
  std::array<pollfd, 2> descriptors{{{_wakeUp.descriptor(), POLLIN, 0}, {_socket.descriptor(), POLLIN, 0}}};
  if (sleep.writable) descriptors[1].events |= POLLOUT;
  const timespec limit{static_cast<time_t>(sleep.limit / 1s), static_cast<long>((sleep.limit % 1s).count())};
  const int ready =
      ::ppoll(descriptors.data(), descriptors.size(), sleep.limit < 0ns ? nullptr : &limit, nullptr);
  {
    const Lock lock(_mutex);
    _wakeAt = kNever;
  }
  if (ready <= 0) return;
  if (descriptors[0].revents != 0) _wakeUp.drain();
  if ((descriptors[1].revents & (POLLIN | POLLHUP | POLLERR)) != 0) _read();
}

}  // namespace zal
