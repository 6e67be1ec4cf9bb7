#include "platform/linux/bus/bus_connection.h"

#include <poll.h>

#include <algorithm>
#include <utility>

#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr std::chrono::milliseconds kFirstDelay = 500ms;
constexpr std::chrono::milliseconds kLongestDelay = 30s;
/// Messages taken in one go; then others of the loop get their turn.
constexpr int kMessagesPerTurn = 64;

std::unique_ptr<sdbus::IProxy> daemonOf(sdbus::IConnection& bus) {
  return sdbus::createProxy(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus");
}
/// For what the library asks the bus itself, and waits for, once the main thread has the connection.
constexpr std::chrono::milliseconds kMainThreadLimit = 200ms;

}  // namespace

/// A connection with the matches that were made together with it, which go before it.
struct BusConnection::Link {
  std::shared_ptr<sdbus::IConnection> bus;
  std::vector<sdbus::Slot> matches;
  unsigned signalWishes = 0;

  /// Waits for the bus: on a queue thread.
  void match(const std::vector<Signals>& signals) {
    if (signals.empty()) return;
    const auto daemon = daemonOf(*bus);
    for (const Signals& wanted : signals) {
      matches.push_back(bus->addMatch(wanted.rule, wanted.onSignal));
      daemon->callMethod("RemoveMatch").onInterface("org.freedesktop.DBus").withArguments(wanted.rule);
    }
  }
};

BusConnection::BusConnection(const BusHost& host, std::string address, std::string name)
    : _host(host), _address(std::move(address)), _name(std::move(name)), _delay(kFirstDelay) {
  // What was sent or asked during a turn decides what to wait for, whoever did it.
  _host.mainLoop.addSleepObserver([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _tend();
  });
}

BusConnection::~BusConnection() {
  if (_bus == nullptr) return;
  for (const auto& member : _members()) {
    if (const auto user = member.lock()) user->onLost();
  }
}

std::unique_ptr<BusConnection::User> BusConnection::addUser(Handlers handlers) {
  _mainThread.check("BusConnection");
  _users.push_back(std::make_shared<Handlers>(std::move(handlers)));
  const auto place = std::prev(_users.end());
  if (!(*place)->signals.empty()) {
    ++_signalWishes;
    if (_bus != nullptr) _renew();
  }
  if (sdbus::IConnection* bus = (*place)->wantsConnection ? connection() : _bus.get()) {
    try {
      (*place)->onConnected(*bus);
    } catch (const sdbus::Error& error) {
      _lose(error.getMessage());
    }
  }
  return std::make_unique<User>(*this, place);
}

sdbus::IConnection* BusConnection::connection() {
  _mainThread.check("BusConnection");
  if (_bus == nullptr && !_isConnecting && !_retry.isSet()) _connect();
  return _bus.get();
}

/// As they are now: handlers may let users join and leave.
std::vector<std::weak_ptr<BusConnection::Handlers>> BusConnection::_members() const {
  return {_users.begin(), _users.end()};
}

void BusConnection::_connect() {
  _retry.cancel();
  if (!mayBeThere(_address)) {
    // No timer where there never was a bus: the next wish looks again, and nobody wakes up meanwhile.
    if (_wasThere) _retryLater();
    return;
  }
  _isConnecting = true;
  _host.queues.global(QueuePriority::standard)
      .async([this, address = _address, signals = _guardedSignals(), wishes = _signalWishes,
              &loop = _host.mainLoop, alive = std::weak_ptr<bool>(_alive)] {
        auto link = std::make_shared<Link>();
        link->signalWishes = wishes;
        std::string trouble;
        try {
          link->bus = openBus(address);
          link->bus->setMethodCallTimeout(kAnswerLimit);
          link->match(signals);
          link->bus->setMethodCallTimeout(kMainThreadLimit);
        } catch (const sdbus::Error& error) {
          trouble = error.getMessage();
          link = std::make_shared<Link>();
        }
        loop.post([this, alive, link = std::move(link), trouble] {
          if (!alive.expired()) _adopt(link, trouble);
        });
      });
}

/// Nothing is called for a user that left; what a handler throws is the loop's, not the bus library's.
std::vector<BusConnection::Signals> BusConnection::_guardedSignals() const {
  std::vector<Signals> guarded;
  for (const auto& user : _users) {
    for (const Signals& wanted : user->signals) {
      guarded.push_back({wanted.rule, [user = std::weak_ptr(user), onSignal = wanted.onSignal,
                                       &loop = _host.mainLoop](sdbus::Message& signal) {
                           if (user.expired()) return;
                           try {
                             onSignal(signal);
                           } catch (const sdbus::Error&) {
                             // Not what a signal of that name holds: not for us.
                           } catch (...) {
                             loop.post([error = std::current_exception()] { std::rethrow_exception(error); });
                           }
                         }});
    }
  }
  return guarded;
}

void BusConnection::_adopt(std::shared_ptr<Link> link, const std::string& trouble) {
  _isConnecting = false;
  if (link->bus == nullptr) {
    if (!std::exchange(_saidLost, true)) {
      _host.log.warning("The " + _name + " cannot be reached: " + trouble);
    }
    _retryLater();
    return;
  }
  if (link->signalWishes != _signalWishes) return _connect();
  try {
    _watch = _host.descriptors.watch(link->bus->getEventLoopPollData().fd, [this] { _process(); });
  } catch (const std::exception& error) {
    _lose(error.what());
    return;
  }
  _link = std::move(link);
  _bus = _link->bus;
  _wasThere = true;
  _delay = kFirstDelay;
  if (std::exchange(_saidLost, false)) _host.log.notice("The " + _name + " is back");
  try {
    _daemon = daemonOf(*_bus);
    const std::weak_ptr<bool> alive = _alive;
    const auto bus = _bus;
    for (const auto& member : _members()) {
      if (const auto user = member.lock()) user->onConnected(*bus);
      if (alive.expired() || _bus != bus) return;
    }
    _tend();
  } catch (const sdbus::Error& error) {
    _lose(error.getMessage());
  }
}

/// Its matches want to be made with it.
void BusConnection::_renew() {
  const std::weak_ptr<bool> alive = _alive;
  _drop(_users.back().get());
  if (!alive.expired() && _bus == nullptr && !_isConnecting) _connect();
}

void BusConnection::_ask(const char* what, const std::string& rule) {
  _mainThread.check("BusConnection");
  if (_daemon == nullptr) return;
  try {
    _daemon->callMethodAsync(what)
        .onInterface("org.freedesktop.DBus")
        .withTimeout(kAnswerLimit)
        .withArguments(rule)
        .uponReplyInvoke([](const sdbus::Error*) {});
  } catch (const sdbus::Error&) {
    // The connection is about to be found lost.
  }
}

void BusConnection::_process() {
  // Handlers may end their users; the connection itself lives on in here.
  const auto bus = _bus;
  const std::weak_ptr<bool> alive = _alive;
  try {
    for (int taken = 0; bus != nullptr && bus == _bus && bus->processPendingRequest();) {
      if (alive.expired()) return;
      if (++taken < kMessagesPerTurn) continue;
      return _host.mainLoop.post([this, alive] {
        if (!alive.expired()) _process();
      });
    }
  } catch (const sdbus::Error& error) {
    if (!alive.expired()) _lose(error.getMessage());
    return;
  }
  if (!alive.expired()) _tend();
}

/// Waits for what the bus library wants to be waited for.
void BusConnection::_tend() {
  if (_bus == nullptr) return;
  sdbus::IConnection::PollData wanted{};
  try {
    wanted = _bus->getEventLoopPollData();
  } catch (const sdbus::Error& error) {
    // Not from here: a sleep observer must not post, and who is told of the loss may.
    _watch->await(true, true);
    return;
  }
  _watch->await((wanted.events & POLLIN) != 0, (wanted.events & POLLOUT) != 0);
  const auto relative = wanted.getRelativeTimeout();
  if (!relative) {
    _timeout.cancel();
    _timeoutAt = {};
    return;
  }
  const SteadyTime at = _host.clock.steadyNow() + std::max<std::chrono::nanoseconds>(*relative, 1ms);
  // Set anew only when it is due earlier, or by much later: a turn must not cost a timer.
  if (_timeout.isSet() && at >= _timeoutAt && at < _timeoutAt + 50ms) return;
  _timeoutAt = at;
  _timeout = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(at - _host.clock.steadyNow(), [this] {
    _timeout = {};
    _process();
  }));
}

void BusConnection::_lose(const std::string& reason) {
  if (!std::exchange(_saidLost, true)) _host.log.warning("The " + _name + " is lost: " + reason);
  const std::weak_ptr<bool> alive = _alive;
  _drop();
  if (!alive.expired()) _retryLater();
}

/// Tells everybody but the newcomer, who never had it.
void BusConnection::_drop(const Handlers* newcomer) {
  const auto bus = std::exchange(_bus, nullptr);
  _watch.reset();
  _timeout.cancel();
  _daemon.reset();
  const auto link = std::exchange(_link, nullptr);
  const std::weak_ptr<bool> alive = _alive;
  RunLoop& loop = _host.mainLoop;
  for (const auto& member : bus != nullptr ? _members() : std::vector<std::weak_ptr<Handlers>>()) {
    const auto user = member.lock();
    if (user != nullptr && user.get() != newcomer) user->onLost();
    if (alive.expired()) break;
  }
  // Later, and after what users leave for later: what hangs on it may be on the stack.
  if (link != nullptr) loop.post([link] {});
}

void BusConnection::_retryLater() {
  _retry = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(_delay, [this] {
    _retry = {};
    if (_bus == nullptr && !_isConnecting) _connect();
  }));
  _delay = std::min(_delay * 2, kLongestDelay);
}

BusConnection::User::User(BusConnection& owner, std::list<std::shared_ptr<Handlers>>::iterator place)
    : _owner(&owner), _ownerAlive(owner._alive), _place(place) {}

BusConnection::User::~User() {
  if (!_ownerAlive.expired()) _owner->_users.erase(_place);
}

}  // namespace zal
