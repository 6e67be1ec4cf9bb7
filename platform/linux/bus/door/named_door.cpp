#include "platform/linux/bus/door/named_door.h"

#include <exception>
#include <utility>

#include "platform/linux/bus/door/bus_request.h"
#include "platform/linux/bus/door/caller_credentials.h"
#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus_module/bus_names.h"
#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

constexpr const char* kAccessDenied = "org.freedesktop.DBus.Error.AccessDenied";
constexpr const char* kLimitsExceeded = "org.freedesktop.DBus.Error.LimitsExceeded";
constexpr const char* kInvalidArgs = "org.freedesktop.DBus.Error.InvalidArgs";
constexpr const char* kDaemonInterface = "org.freedesktop.DBus";
constexpr const char* kOwnerChangedRule =
    "type='signal',sender='org.freedesktop.DBus',path='/org/freedesktop/DBus',"
    "interface='org.freedesktop.DBus',member='NameOwnerChanged'";
constexpr std::size_t kLongestNewsText = 4096;

// Answers of RequestName.
constexpr std::uint32_t kInQueue = 2;

std::string leavingRule(const std::string& name) {
  return std::string(kOwnerChangedRule) + ",arg0='" + name + "'";
}

std::string newsText(const std::string& text) { return replacedUtf8(text.substr(0, kLongestNewsText)); }

}  // namespace

NamedDoor::NamedDoor(const BusHost& host, BusConnection& connection, std::string busName)
    : _host(host), _connection(connection), _busName(std::move(busName)) {}

NamedDoor::~NamedDoor() {
  // Nobody is told of anything any more.
  _handler = [](const auto&, const auto&) {};
  for (const auto& caller : _callers()) caller->cancel();
}

void NamedDoor::open(PeerHandler onPeerEvent) {
  _handler = std::move(onPeerEvent);
  _access = AccessPolicy(groupIdentifier(_host.configuration.ipc.group));
  _user = _connection.addUser(
      {.onConnected = [this](sdbus::IConnection& bus) { _enter(bus); },
       .onLost = [this] { _leaveBus(); },
       .signals = {{kOwnerChangedRule, [this](sdbus::Message& signal) { _ownerChanged(signal); }}}});
}

void NamedDoor::_enter(sdbus::IConnection& bus) {
  _daemon = sdbus::createProxy(bus, kDaemonInterface, "/org/freedesktop/DBus");
  _object = sdbus::createObject(bus, kObjectPath);
  _object->registerMethod(kInterfaceName, "Request", "a{sv}", {"request"}, "a{sv}", {"reply"},
                          [this](sdbus::MethodCall call) { _take(std::move(call)); });
  _object->registerSignal(kInterfaceName, "Progress", "sssuuss",
                          {"directory", "service", "event", "step", "steps", "what", "detail"});
  for (const char* notification : {"kLirraSyncLoggingPrefs", "LirraLoggingDumpComplete"}) {
    _object->registerSignal(kInterfaceName, notification, "s", {"id"});
  }
  _object->finishRegistration();
  _wantName();
}

/// Waits in line for a name that is taken: an agent before us may be about to end.
void NamedDoor::_wantName() {
  _daemon->callMethodAsync("RequestName")
      .onInterface(kDaemonInterface)
      .withTimeout(kAnswerLimit)
      .withArguments(std::string(kBusName), std::uint32_t{0})
      .uponReplyInvoke([this](const sdbus::Error* error, std::uint32_t answer) {
        if (error != nullptr) return _sayNameless("cannot be had: " + error->getMessage());
        if (answer == kInQueue) return _sayNameless("is taken");
        _saidNameless = false;
      });
}

void NamedDoor::_sayNameless(const std::string& reason) {
  if (std::exchange(_saidNameless, true)) return;
  _host.log.warning("The name " + std::string(kBusName) + " on the " + _busName + " " + reason +
                    "; requests come by the socket alone");
}

void NamedDoor::_leaveBus() {
  ++_busesLost;
  _daemon.reset();
  while (!_visitors.empty()) _forget(std::string(_visitors.begin()->first));
  // Later: one of its calls may be on the stack.
  if (_object != nullptr)
    _host.mainLoop.post([object = std::shared_ptr<sdbus::IObject>(std::move(_object))] {});
}

void NamedDoor::_take(sdbus::MethodCall call) {
  const std::string name = call.getSender();
  const auto known = _visitors.find(name);
  if (known == _visitors.end() && !_hasRoom())
    return refuse(call, kLimitsExceeded, "the agent has too many callers");
  if (known != _visitors.end() && known->second.isRefused)
    return refuse(call, kAccessDenied, "you may not talk to the agent");
  std::optional<ReadDictionary> dictionary;
  try {
    dictionary = readDictionary(call, {.bytes = _host.configuration.ipc.maximumPayload});
  } catch (const sdbus::Error& error) {
    return refuse(call, kInvalidArgs, error.getMessage());
  }
  if (!dictionary) return refuse(call, kLimitsExceeded, "the request is too large");
  // Who it is is asked once the request has been read, for that may take longer than an answer may.
  Visitor& visitor = _visitors[name];
  if (known == _visitors.end()) _identify(name);
  if (visitor.caller != nullptr) return _carryOut(visitor.caller, *std::move(dictionary), std::move(call));
  _hold(visitor, *std::move(dictionary), std::move(call));
}

/// For one more caller.
bool NamedDoor::_hasRoom() {
  if (_visitors.size() < kMostCallers) return true;
  if (!std::exchange(_saidFull, true)) {
    _host.log.warning("More than " + std::to_string(kMostCallers) + " callers on the " + _busName +
                      "; further ones are refused");
  }
  return false;
}

void NamedDoor::_hold(Visitor& visitor, ReadDictionary dictionary, sdbus::MethodCall call) {
  const bool hasRoom = visitor.held.size() < kMostOpenCalls &&
                       _heldBytes + dictionary.bytes <= _host.configuration.ipc.maximumPayload;
  if (!hasRoom) return refuse(call, kLimitsExceeded, "too many requests before the first answer");
  _heldBytes += dictionary.bytes;
  visitor.held.push_back({std::move(dictionary), std::move(call)});
}

/// In this order: who leaves before the question is answered is no longer known, who leaves after it is
/// heard of.
void NamedDoor::_identify(const std::string& name) {
  _connection.listen(leavingRule(name));
  _daemon->callMethodAsync("GetConnectionCredentials")
      .onInterface(kDaemonInterface)
      .withTimeout(kAnswerLimit)
      .withArguments(name)
      .uponReplyInvoke([this, name](const sdbus::Error* error, std::map<std::string, sdbus::Variant> answer) {
        if (error != nullptr) answer.clear();
        // On a turn of its own: what a request starts must not run inside the bus library.
        _host.mainLoop.post([this, name, answer = std::move(answer), buses = _busesLost,
                             alive = std::weak_ptr<bool>(_alive)] {
          if (!alive.expired() && buses == _busesLost) _decide(name, answer);
        });
      });
}

void NamedDoor::_decide(const std::string& name, const std::map<std::string, sdbus::Variant>& answer) {
  const auto place = _visitors.find(name);
  if (place == _visitors.end() || place->second.caller != nullptr) return;
  Visitor& visitor = place->second;
  std::vector<HeldRequest> held;
  held.swap(visitor.held);
  for (const HeldRequest& request : held) _heldBytes -= request.dictionary.bytes;

  const auto credentials = callerCredentials(answer);
  if (!credentials || !admits(_access, *credentials)) {
    for (const HeldRequest& request : held)
      refuse(request.call, kAccessDenied, "you may not talk to the agent");
    if (!credentials) return _forget(name);  // it left, or the bus does not know it: it may ask again
    visitor.isRefused = true;
    _host.log.warning("Process " + std::to_string(credentials->peer.process) + " of user " +
                      std::to_string(credentials->peer.user) + " may not talk to the agent over the " +
                      _busName + "; it is refused");
    return;
  }
  const auto caller = std::make_shared<BusCaller>(_host.mainLoop, credentials->peer,
                                                  [this, name, alive = std::weak_ptr<bool>(_alive)] {
                                                    if (!alive.expired()) _forget(name);
                                                  });
  visitor.caller = caller;
  for (HeldRequest& request : held) {
    _carryOut(caller, std::move(request.dictionary), std::move(request.call));
  }
}

void NamedDoor::_carryOut(const std::shared_ptr<BusCaller>& caller, ReadDictionary dictionary,
                          sdbus::MethodCall call) {
  if (call.doesntExpectReply()) {
    const BusRequest request(std::move(dictionary.values), std::nullopt);
    return _tell(caller, &request);
  }
  if (caller->openCalls() >= kMostOpenCalls) {
    return refuse(call, kLimitsExceeded, "too many requests without an answer");
  }
  const std::uint64_t token = caller->keep(std::move(call));
  const BusRequest request(std::move(dictionary.values), token);
  const auto peer = caller->owing(token);
  _tell(peer, &request);
  _host.flush();
}

void NamedDoor::_tell(const std::shared_ptr<PeerConnection>& peer, const IpcEvent& event) {
  if (!peer->isConnected()) return;
  try {
    _handler(peer, event);
  } catch (...) {
    _host.mainLoop.post([error = std::current_exception()] { std::rethrow_exception(error); });
  }
}

void NamedDoor::_forget(const std::string& name) {
  auto node = _visitors.extract(name);
  if (node.empty()) return;
  _connection.stopListening(leavingRule(name));
  for (const HeldRequest& request : node.mapped().held) _heldBytes -= request.dictionary.bytes;
  if (_visitors.empty()) _saidFull = false;
  const auto& caller = node.mapped().caller;
  if (caller == nullptr) return;
  _tell(caller, IpcError::connectionInvalid);
  caller->cancel();
}

void NamedDoor::_ownerChanged(sdbus::Message& signal) {
  std::string name;
  std::string before;
  std::string after;
  signal >> name >> before >> after;
  if (after.empty()) _forget(name);
}

void NamedDoor::terminationImminent() {
  for (const auto& caller : _callers()) _tell(caller, IpcError::terminationImminent);
}

std::vector<std::shared_ptr<BusCaller>> NamedDoor::_callers() const {
  std::vector<std::shared_ptr<BusCaller>> callers;
  for (const auto& [name, visitor] : _visitors) {
    if (visitor.caller != nullptr) callers.push_back(visitor.caller);
  }
  return callers;
}

void NamedDoor::announce(const DumpNews& news) {
  if (_object == nullptr) return;
  try {
    auto signal = _object->createSignal(kInterfaceName, "Progress");
    signal << newsText(news.directory) << newsText(news.service) << news.event
           << static_cast<std::uint32_t>(news.step) << static_cast<std::uint32_t>(news.steps)
           << newsText(news.what) << newsText(news.detail);
    signal.send();
  } catch (const sdbus::Error&) {
    // The bus is about to be found lost.
  }
}

}  // namespace zal
