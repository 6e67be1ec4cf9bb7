#include "platform/linux/log/journal_mirror.h"

#include <algorithm>
#include <utility>

namespace zal {
namespace {

using namespace std::chrono_literals;

/// How often a journal that is not there, or takes nothing, is looked for.
constexpr auto kJournalLookInterval = 1s;
/// The journal reads what its socket holds within this time.
constexpr auto kJournalRetryDelay = 10ms;
/// One that took nothing for so long is asleep or stopped; waiting on would only keep the agent awake.
constexpr auto kPatience = 1s;
/// A flood is over when nothing was left out for so long.
constexpr auto kQuiet = 1s;
/// Ten thousand a second. Of a flood only so much is worth the journal's time, which is ten times that
/// of the file; its own rate limit would leave out more.
constexpr auto kWindow = 100ms;
constexpr std::size_t kMostInWindow = 1000;

constexpr std::string_view kGone = "the journal is gone; records go into their files alone";
constexpr std::string_view kStalled = "the journal takes nothing; records go into their files alone";

bool isOlderThan(SteadyTime moment, std::chrono::nanoseconds age, SteadyTime now) {
  return moment == SteadyTime::min() || now - moment >= age;
}

}  // namespace

JournalMirror::JournalMirror(Host host, std::string socketPath) : _host(host), _path(std::move(socketPath)) {
  _host.mainLoop.addSleepObserver([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _beforeSleep();
  });
}

void JournalMirror::record(const LogRecord& record) {
  _mainThread.check("JournalMirror");
  if ((_state == State::working || _maySend()) && _queue.add(record)) return;
  // What is said about records that are missing is no such record.
  if (_wasThere && !_isSaying) ++_missed;
}

void JournalMirror::flush() {
  _mainThread.check("JournalMirror");
  _sendWhatGoes();
  _giveUpQueue();
  if (_missed == 0) return;
  _sayMissed();
  _sendWhatGoes();
  _queue.clear();
}

bool JournalMirror::_maySend() {
  if (_hasLooked) return false;
  _hasLooked = true;
  const SteadyTime now = _host.clock.steadyNow();
  if (!isOlderThan(_lastLook, kJournalLookInterval, now)) return false;
  _lastLook = now;
  if (!_socket.connect(_path)) {
    _state = State::absent;
    return false;
  }
  // One that took nothing before has to take this first record before it gets more.
  if (_state == State::absent) _state = State::working;
  _wasThere = true;
  return true;
}

void JournalMirror::_beforeSleep() {
  _hasLooked = false;
  if (!_queue.empty() && !_retry.isSet()) _send();
}

void JournalMirror::_send() {
  const SteadyTime now = _host.clock.steadyNow();
  std::size_t allowed = _allowance(now);
  bool mayConnect = true;
  while (!_queue.empty() && allowed > 0) {
    const JournalSocket::Sent sent = _socket.send(_queue.front(allowed));
    _queue.removeFront(sent.count);
    allowed -= sent.count;
    _sentInWindow += sent.count;
    if (sent.count > 0) {
      _state = State::working;
      _isFull = false;
    }
    switch (sent.stop) {
      case JournalSocket::Stop::none:
        break;
      case JournalSocket::Stop::full:
        _awaitRoom(now);
        return;
      case JournalSocket::Stop::tooLarge:
        if (_queue.sealFront()) break;
        [[fallthrough]];
      case JournalSocket::Stop::refused:
        _queue.removeFront(1);
        ++_missed;
        break;
      case JournalSocket::Stop::gone:
        if (!std::exchange(mayConnect, false) || !_socket.connect(_path)) {
          _lastLook = now;
          _leaveOut(State::absent, kGone);
          return;
        }
        break;
    }
  }
  if (!_queue.empty()) _armRetry();
  if (_missed > 0) _armReport();
}

void JournalMirror::_sendWhatGoes() {
  _windowStart = SteadyTime::min();
  if (!_queue.empty()) _send();
  _retry = {};
}

void JournalMirror::_awaitRoom(SteadyTime now) {
  if (!std::exchange(_isFull, true)) _fullSince = now;
  if (_state == State::stalled || now - _fullSince >= kPatience) {
    _lastLook = now;
    _leaveOut(State::stalled, kStalled);
  } else {
    _armRetry();
  }
}

void JournalMirror::_leaveOut(State state, std::string_view why) {
  _giveUpQueue();
  if (std::exchange(_state, state) != State::working) return;
  // Not from here: the loop is about to sleep, and the files were written out already.
  _sayTimer = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(0ns, [this, why] {
    _sayTimer = {};
    _say(why);
  }));
}

void JournalMirror::_giveUpQueue() {
  _missed += _queue.size();
  _queue.clear();
}

std::size_t JournalMirror::_allowance(SteadyTime now) {
  if (isOlderThan(_windowStart, kWindow, now)) {
    _windowStart = now;
    _sentInWindow = 0;
  }
  return kMostInWindow - std::min(_sentInWindow, kMostInWindow);
}

/// The timer only wakes the loop up: what is due is sent when it is about to sleep again.
void JournalMirror::_armRetry() {
  _retry = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(kJournalRetryDelay, [this] { _retry = {}; }));
}

void JournalMirror::_armReport() {
  if (_reportTimer.isSet()) return;
  _missedBefore = _missed;
  _reportTimer = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(kQuiet, [this] {
    _reportTimer = {};
    _report();
  }));
}

void JournalMirror::_report() {
  if (_missed == 0 || _state != State::working) return;
  if (_missed != _missedBefore || !_queue.empty()) {
    _armReport();
  } else {
    _sayMissed();
  }
}

void JournalMirror::_sayMissed() {
  _say("records in their files but not in the journal: " + std::to_string(std::exchange(_missed, 0)));
}

void JournalMirror::_say(std::string_view text) {
  _isSaying = true;
  _host.log.warning(text);
  _isSaying = false;
}

}  // namespace zal
