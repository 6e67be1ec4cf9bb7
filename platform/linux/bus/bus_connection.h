#pragma once

#include <chrono>
#include <functional>
#include <list>
#include <memory>
#include <string>
#include <vector>

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
///
/// Who wants signals says with `signals` what it would ever hear, and with listen() what the bus is to
/// send: the bus library knows no way to add a match without waiting for the bus, so the wide ones are
/// made on the queue thread with the connection and taken back from the bus at once.
class BusConnection {
 public:
  /// What of the signals that arrive is for a user: a match rule, as the bus daemon reads them.
  struct Signals {
    std::string rule;
    std::function<void(sdbus::Message& signal)> onSignal;
  };
  struct Handlers {
    std::function<void(sdbus::IConnection& bus)> onConnected = [](sdbus::IConnection&) {};
    std::function<void()> onLost = [] {};
    /// A user with these that comes when the connection is there already makes everybody lose it once.
    std::vector<Signals> signals = {};
    /// Without it the user hears of a connection that others want; its own wish comes by connection().
    bool wantsConnection = true;
  };
  /// A user's membership; no handler of it runs after its end.
  class User;

  /// `name` is how the log calls the bus: "system bus".
  BusConnection(const BusHost& host, std::string address, std::string name);
  ~BusConnection();
  BusConnection(const BusConnection&) = delete;
  BusConnection& operator=(const BusConnection&) = delete;

  /// The handler runs at once when the connection is there.
  [[nodiscard]] std::unique_ptr<User> addUser(Handlers handlers);
  /// Nothing while there is none; then one is tried for, unless a try was made a moment ago.
  [[nodiscard]] sdbus::IConnection* connection();
  /// Has the bus send what the rule matches, or no longer; for this connection, so again after each
  /// onConnected. Does nothing while there is no connection.
  void listen(const std::string& rule) { _ask("AddMatch", rule); }
  void stopListening(const std::string& rule) { _ask("RemoveMatch", rule); }

 private:
  struct Link;
  void _connect();
  void _adopt(std::shared_ptr<Link> link, const std::string& trouble);
  void _renew();
  void _drop(const Handlers* newcomer = nullptr);
  void _ask(const char* what, const std::string& rule);
  [[nodiscard]] std::vector<Signals> _guardedSignals() const;
  [[nodiscard]] std::vector<std::weak_ptr<Handlers>> _members() const;
  void _process();
  void _tend();
  void _lose(const std::string& reason);
  void _retryLater();

  const BusHost& _host;
  const std::string _address;
  const std::string _name;
  MainThreadCheck _mainThread;
  std::list<std::shared_ptr<Handlers>> _users;
  unsigned _signalWishes = 0;  // users so far that wanted signals
  bool _isConnecting = false;
  bool _saidLost = false;
  bool _wasThere = false;
  std::chrono::milliseconds _delay;
  ScopedTimer _retry;
  ScopedTimer _timeout;  // of the calls that are open
  SteadyTime _timeoutAt{};
  std::shared_ptr<Link> _link;
  std::shared_ptr<sdbus::IConnection> _bus;  // the link's
  std::unique_ptr<sdbus::IProxy> _daemon;
  std::unique_ptr<DescriptorWatch> _watch;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

class BusConnection::User {
 public:
  User(BusConnection& owner, std::list<std::shared_ptr<Handlers>>::iterator place);
  ~User();
  User(const User&) = delete;
  User& operator=(const User&) = delete;

 private:
  BusConnection* _owner;
  std::weak_ptr<bool> _ownerAlive;
  std::list<std::shared_ptr<Handlers>>::iterator _place;
};

}  // namespace zal
