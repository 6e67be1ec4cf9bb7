#pragma once

#include <cstddef>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/linux/bus/bus_connection.h"
#include "platform/linux/bus/door/bus_caller.h"
#include "platform/linux/bus/door/bus_dictionary.h"
#include "platform/linux/bus_module/bus_door.h"
#include "platform/linux/ipc/access_policy.h"

namespace zal {

/// The name com.vendel.lirra on one bus, with the method Request(a{sv}) -> a{sv}: docs/bus.md. Lets in
/// whom the socket would let in, by what the bus daemon had from the kernel. Main thread only.
class NamedDoor : public BusDoor {
 public:
  static constexpr std::size_t kMostCallers = 256;
  static constexpr std::size_t kMostOpenCalls = 64;  ///< of one caller

  /// `busName` is how the log calls the bus. Host and connection outlive this.
  NamedDoor(const BusHost& host, BusConnection& connection, std::string busName);
  ~NamedDoor() override;

  void open(PeerHandler onPeerEvent) override;
  void terminationImminent() override;
  void announce(const DumpNews& news) override;

 private:
  struct HeldRequest {
    ReadDictionary dictionary;
    sdbus::MethodCall call;
  };
  /// A connection that called. Its requests wait until the bus has said who it is.
  struct Visitor {
    bool isRefused = false;
    std::shared_ptr<BusCaller> caller;  // once it is let in
    std::vector<HeldRequest> held;
  };
  using Visitors = std::map<std::string, Visitor>;

  void _enter(sdbus::IConnection& bus);
  void _leaveBus();
  void _wantName();
  void _sayNameless(const std::string& reason);
  void _take(sdbus::MethodCall call);
  [[nodiscard]] bool _hasRoom();
  void _hold(Visitor& visitor, ReadDictionary dictionary, sdbus::MethodCall call);
  void _identify(const std::string& name);
  void _decide(const std::string& name, const std::map<std::string, sdbus::Variant>& credentials);
  void _carryOut(const std::shared_ptr<BusCaller>& caller, ReadDictionary dictionary, sdbus::MethodCall call);
  void _tell(const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event);
  void _forget(const std::string& name);
  void _ownerChanged(sdbus::Message& signal);
  [[nodiscard]] std::vector<std::shared_ptr<BusCaller>> _callers() const;

  const BusHost& _host;
  BusConnection& _connection;
  const std::string _busName;
  AccessPolicy _access{std::nullopt};
  PeerHandler _handler;
  bool _saidNameless = false;
  bool _saidFull = false;
  std::size_t _heldBytes = 0;
  unsigned _busesLost = 0;  // names of callers are given out again by the next one
  Visitors _visitors;
  std::unique_ptr<sdbus::IObject> _object;  // both while there is a bus
  std::unique_ptr<sdbus::IProxy> _daemon;
  std::unique_ptr<BusConnection::User> _user;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
