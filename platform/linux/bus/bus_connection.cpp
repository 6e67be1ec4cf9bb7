#include "platform/linux/bus/bus_connection.h"

#include <poll.h>

#include <algorithm>
#include <utility>

#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {
namespace {

using namespace std::chrono_literals;

constexpr std::chrono::milliseconds kFirstDelay = 500ms;
constexpr std::chrono::milliseconds kLongestDelay = 30s;

}  // namespace

BusConnection::BusConnection(const BusHost& host, std::string address, std::string name)
    : _host(host), _address(std::move(address)), _name(std::move(name)), _delay(kFirstDelay) {
  // What was sent or asked during a turn decides what to wait for, whoever did it.
  _host.mainLoop.addSleepObserver([this, alive = std::weak_ptr<bool>(_alive)] {
    if (!alive.expired()) _tend();
  });
}

BusConnection::~BusConnection() {
  for (const Handlers& user : _users) {
    if (_bus != nullptr) user.onLost();
  }
}

std::unique_ptr<BusConnection::User> BusConnection::addUser(Handlers handlers) {
  _mainThread.check("BusConnection");
  _users.push_back(std::move(handlers));
  const auto place = std::prev(_users.end());
  if (sdbus::IConnection* bus = connection()) {
    try {
      place->onConnected(*bus);
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

void BusConnection::_connect() {
  _retry.cancel();
  if (!mayBeThere(_address)) {
    // No timer where there never was a bus: the next wish looks again, and nobody wakes up meanwhile.
    if (_wasThere) _retryLater();
    return;
  }
  _isConnecting = true;
  _host.queues.global(QueuePriority::standard)
      .async([this, address = _address, &loop = _host.mainLoop, alive = std::weak_ptr<bool>(_alive)] {
        std::shared_ptr<sdbus::IConnection> bus;
        std::string trouble;
        try {
          bus = sdbus::createSessionBusConnectionWithAddress(address);
        } catch (const sdbus::Error& error) {
          trouble = error.getMessage();
        }
        loop.post([this, alive, bus = std::move(bus), trouble] {
          if (!alive.expired()) _adopt(bus, trouble);
        });
      });
}

void BusConnection::_adopt(std::shared_ptr<sdbus::IConnection> bus, const std::string& trouble) {
  _isConnecting = false;
  if (bus == nullptr) {
    if (!std::exchange(_saidLost, true)) {
      _host.log.warning("The " + _name + " cannot be reached: " + trouble);
    }
    _retryLater();
    return;
  }
  try {
    _watch = _host.descriptors.watch(bus->getEventLoopPollData().fd, [this] { _process(); });
  } catch (const std::exception& error) {
    _lose(error.what());
    return;
  }
  _bus = std::move(bus);
  _wasThere = true;
  _delay = kFirstDelay;
  if (std::exchange(_saidLost, false)) _host.log.notice("The " + _name + " is back");
  try {
    for (auto place = _users.begin(); place != _users.end();) {
      const auto user = place++;
      user->onConnected(*_bus);
    }
    _tend();
  } catch (const sdbus::Error& error) {
    _lose(error.getMessage());
  }
}

void BusConnection::_process() {
  // Handlers may end their users; the connection itself lives on in here.
  const auto bus = _bus;
  const std::weak_ptr<bool> alive = _alive;
  try {
    while (bus != nullptr && bus == _bus && bus->processPendingRequest()) {
      if (alive.expired()) return;
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
  const auto bus = std::exchange(_bus, nullptr);
  _watch.reset();
  _timeout.cancel();
  const std::weak_ptr<bool> alive = _alive;
  if (bus != nullptr) {
    for (auto place = _users.begin(); place != _users.end();) {
      const auto user = place++;
      user->onLost();
      if (alive.expired()) return;
    }
  }
  _retryLater();
}

void BusConnection::_retryLater() {
  _retry = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(_delay, [this] {
    _retry = {};
    if (_bus == nullptr && !_isConnecting) _connect();
  }));
  _delay = std::min(_delay * 2, kLongestDelay);
}

BusConnection::User::User(BusConnection& owner, std::list<Handlers>::iterator place)
    : _owner(&owner), _ownerAlive(owner._alive), _place(place) {}

BusConnection::User::~User() {
  if (!_ownerAlive.expired()) _owner->_users.erase(_place);
}

}  // namespace zal
