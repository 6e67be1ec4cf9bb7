#pragma once

#include <chrono>
#include <functional>
#include <list>
#include <memory>
#include <string>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/bus_module/bus_host.h"
#include "platform/main_thread_check.h"

namespace zal {

/// One connection to one bus for everything that the main thread does there, all of it asynchronous.
/// It comes into being with the first wish for it, is made on a queue thread (a bus daemon that hangs
/// hangs nobody), and is made again when it was lost, after a delay that grows to half a minute. One
/// line in the log says that it was lost, one that it is back. Main thread only.
///
///     connection.addUser({.onConnected = [&](sdbus::IConnection& bus) { proxy = createProxy(bus, ...); },
///                         .onLost = [&] { proxy.reset(); }});
///
/// Users drop their proxies, objects and slots in onLost, or leave with their User before. Calls are
/// made with callMethodAsync and a time limit alone.
class BusConnection {
 public:
  struct Handlers {
    std::function<void(sdbus::IConnection& bus)> onConnected = [](sdbus::IConnection&) {};
    std::function<void()> onLost = [] {};
  };
  /// A user's membership; no handler of it runs after its end.
  class User;

  /// `name` is how the log calls the bus: "system bus".
  BusConnection(const BusHost& host, std::string address, std::string name);
  ~BusConnection();
  BusConnection(const BusConnection&) = delete;
  BusConnection& operator=(const BusConnection&) = delete;

  /// Wants the connection from now on. The handler runs at once when it is there.
  [[nodiscard]] std::unique_ptr<User> addUser(Handlers handlers);
  /// Nothing while there is none; then one is tried for, unless a try was made a moment ago.
  [[nodiscard]] sdbus::IConnection* connection();

 private:
  struct Attempt;
  void _connect();
  void _adopt(std::shared_ptr<sdbus::IConnection> bus, const std::string& trouble);
  void _process();
  void _tend();
  void _lose(const std::string& reason);
  void _retryLater();

  const BusHost& _host;
  const std::string _address;
  const std::string _name;
  MainThreadCheck _mainThread;
  std::list<Handlers> _users;
  bool _isConnecting = false;
  bool _saidLost = false;
  bool _wasThere = false;
  std::chrono::milliseconds _delay;
  ScopedTimer _retry;
  ScopedTimer _timeout;  // of the calls that are open
  SteadyTime _timeoutAt{};
  std::shared_ptr<sdbus::IConnection> _bus;
  std::unique_ptr<DescriptorWatch> _watch;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

class BusConnection::User {
 public:
  User(BusConnection& owner, std::list<Handlers>::iterator place);
  ~User();
  User(const User&) = delete;
  User& operator=(const User&) = delete;

 private:
  BusConnection* _owner;
  std::weak_ptr<bool> _ownerAlive;
  std::list<Handlers>::iterator _place;
};

}  // namespace zal
