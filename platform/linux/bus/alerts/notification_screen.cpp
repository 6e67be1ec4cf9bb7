#include "platform/linux/bus/alerts/notification_screen.h"

#include <utility>

#include "platform/linux/alerts/alert_record.h"
#include "platform/linux/bus_module/bus_addresses.h"

namespace zal {
namespace {

constexpr const char* kNotificationServer = "org.freedesktop.Notifications";
constexpr const char* kNotificationPath = "/org/freedesktop/Notifications";
constexpr const char* kOwnerRule =
    "type='signal',sender='org.freedesktop.DBus',member='NameOwnerChanged',arg0='org.freedesktop."
    "Notifications'";
constexpr const char* kServerRule =
    "type='signal',path='/org/freedesktop/Notifications',interface='org.freedesktop.Notifications'";
constexpr const char* kNotifyingProgram = "ZalLoggingAgent";
constexpr std::uint32_t kClosedByPerson = 2;
constexpr std::int32_t kNeverExpires = 0;

std::string serverRule(const std::string& uniqueName) {
  return std::string(kServerRule) + ",sender='" + uniqueName + "'";
}

}  // namespace

NotificationScreen::NotificationScreen(const BusHost& host, BusConnection& sessionBus, Limits limits)
    : _host(host), _sessionBus(sessionBus), _limits(limits) {
  // From the start, for what is to be heard; an alert is what wants the connection.
  _user = _sessionBus.addUser(
      {.onConnected = [this](sdbus::IConnection& bus) { _join(bus); },
       .onLost = [this] { _leave(); },
       .signals = {{kOwnerRule, [this](sdbus::Message& signal) { _takeOwnerChange(signal); }},
                   {kServerRule, [this](sdbus::Message& signal) { _takeServerSignal(signal); }}},
       .wantsConnection = false});
}

NotificationScreen::~NotificationScreen() = default;

void NotificationScreen::present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) {
  if (alert.textField || !mayBeThere(_host.sessionBus)) {
    handlers.onDeclined();
    return;
  }
  const Place place = _shown.insert_or_assign(id, Shown{alert, std::move(handlers)}).first;
  place->second.patience = ScopedTimer(_host.mainLoop, _host.mainLoop.callAfter(_limits.patience, [this, id] {
    const Place late = _shown.find(id);
    if (late == _shown.end()) return;
    _complain("it does not answer");
    _decline(late);
  }));
  if (_sessionBus.connection() != nullptr) {
    _server && _server->abilities ? _notify(place) : _lookForServer();
  }
}

void NotificationScreen::_join(sdbus::IConnection& bus) {
  _bus = &bus;
  _daemon = sdbus::createProxy(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus");
  _lookForServer();
}

void NotificationScreen::_leave() {
  _loseServer();
  _daemon.reset();
  _isWatching = false;
  _busId.clear();
  _bus = nullptr;
}

void NotificationScreen::_lookForServer() {
  if (_daemon == nullptr || _shown.empty()) return;
  if (!std::exchange(_isWatching, true)) _sessionBus.listen(kOwnerRule);
  if (!_busId.empty()) {
    _askOwner();
    return;
  }
  _daemon->callMethodAsync("GetId")
      .onInterface("org.freedesktop.DBus")
      .withTimeout(_limits.call)
      .uponReplyInvoke([this](const sdbus::Error* error, const std::string& id) {
        if (error != nullptr) return;
        _busId = id;
        _askOwner();
      });
}

void NotificationScreen::_takeOwnerChange(sdbus::Message& signal) {
  std::string name;
  std::string before;
  std::string now;
  signal >> name >> before >> now;
  if (_server && _server->uniqueName == before) _loseServer();
  if (!now.empty() && !_busId.empty() && !_shown.empty()) _takeServer(now);
}

/// Who has the name, not the name itself, is spoken to: a call to a name could start a server.
void NotificationScreen::_askOwner() {
  _daemon->callMethodAsync("GetNameOwner")
      .onInterface("org.freedesktop.DBus")
      .withTimeout(_limits.call)
      .withArguments(std::string(kNotificationServer))
      .uponReplyInvoke([this](const sdbus::Error* error, const std::string& owner) {
        if (error == nullptr) {
          _takeServer(owner);
        } else if (error->getName() == "org.freedesktop.DBus.Error.NameHasNoOwner") {
          _declineAll(true);
        }
      });
}

void NotificationScreen::_takeServer(const std::string& uniqueName) {
  if (_server && _server->uniqueName == uniqueName) {
    _server->abilities ? _notifyAll() : _askCapabilities();
    return;
  }
  // After a reconnection it may be the same one, with our alerts on the screen.
  const std::string before = std::exchange(_numbersOf, _busId + uniqueName);
  if (_numbersOf != before) {
    for (auto& [id, shown] : _shown) shown.number = 0;
  }
  _forgetServer();
  _server = Server{uniqueName};
  _server->proxy = sdbus::createProxy(*_bus, uniqueName, kNotificationPath);
  _sessionBus.listen(serverRule(uniqueName));
  _askCapabilities();
}

void NotificationScreen::_takeServerSignal(sdbus::Message& signal) {
  if (!_server || signal.getSender() != _server->uniqueName) return;
  std::uint32_t number = 0;
  if (signal.getMemberName() == "ActionInvoked") {
    std::string key;
    signal >> number >> key;
    _takeAction(number, key);
  } else if (signal.getMemberName() == "NotificationClosed") {
    std::uint32_t reason = 0;
    signal >> number >> reason;
    _takeClosed(number, reason);
  }
}

void NotificationScreen::_askCapabilities() {
  if (std::exchange(_server->isAsked, true)) return;
  _server->proxy->callMethodAsync("GetCapabilities")
      .onInterface(kNotificationServer)
      .withTimeout(_limits.call)
      .uponReplyInvoke([this](const sdbus::Error* error, const std::vector<std::string>& capabilities) {
        _takeCapabilities(error, capabilities);
      });
}

void NotificationScreen::_takeCapabilities(const sdbus::Error* error,
                                           const std::vector<std::string>& capabilities) {
  _server->isAsked = false;
  const NotificationAbilities abilities = notificationAbilities(capabilities);
  if (error == nullptr && abilities.hasActions) {
    _server->abilities = abilities;
    _notifyAll();
    return;
  }
  if (error != nullptr) _complain(error->getMessage());
  _declineAll(false);
}

void NotificationScreen::_forgetServer() {
  if (_server) _sessionBus.stopListening(serverRule(_server->uniqueName));
  _server.reset();
}

void NotificationScreen::_loseServer() {
  _forgetServer();
  for (auto& [id, shown] : _shown) shown.isAsked = false;
}

void NotificationScreen::_notifyAll() {
  for (auto place = _shown.begin(); place != _shown.end(); ++place) _notify(place);
}

void NotificationScreen::_notify(Place place) {
  Shown& shown = place->second;
  if (shown.number != 0 || shown.isAsked) return;
  shown.isAsked = true;
  const NotificationText text = notificationText(shown.alert, *_server->abilities);
  const std::map<std::string, sdbus::Variant> hints{{"urgency", sdbus::Variant(text.urgency)}};
  try {
    _server->proxy->callMethodAsync("Notify")
        .onInterface(kNotificationServer)
        .withTimeout(_limits.call)
        .withArguments(std::string(kNotifyingProgram), std::uint32_t{0}, text.icon, text.summary, text.body,
                       text.actions, hints, kNeverExpires)
        .uponReplyInvoke([this, id = place->first](const sdbus::Error* error, std::uint32_t number) {
          _takeNumber(id, error, number);
        });
  } catch (const sdbus::Error&) {  // NOLINT(bugprone-empty-catch)
    // The bus is gone, which its connection is about to notice; or patience ends.
  }
}

void NotificationScreen::_takeNumber(const std::string& id, const sdbus::Error* error, std::uint32_t number) {
  const Place place = _shown.find(id);
  if (error != nullptr) {
    _complain(error->getMessage());
    if (place != _shown.end()) _decline(place);
    return;
  }
  if (place == _shown.end()) {
    _close(number);
    return;
  }
  _complained = false;
  Shown& shown = place->second;
  shown.number = number;
  shown.isAsked = false;
  shown.wasShown = true;
  shown.patience.cancel();
}

void NotificationScreen::_close(std::uint32_t number) {
  if (number == 0 || !_server) return;
  try {
    _server->proxy->callMethodAsync("CloseNotification")
        .onInterface(kNotificationServer)
        .withTimeout(_limits.call)
        .withArguments(number)
        .uponReplyInvoke([](const sdbus::Error*) {});
  } catch (const sdbus::Error&) {  // NOLINT(bugprone-empty-catch)
    // The bus is gone, and what was shown with it.
  }
}

NotificationScreen::Place NotificationScreen::_placeOf(std::uint32_t number) {
  auto place = _shown.begin();
  while (place != _shown.end() && (number == 0 || place->second.number != number)) ++place;
  return place;
}

void NotificationScreen::_takeAction(std::uint32_t number, const std::string& key) {
  const Place place = _placeOf(number);
  const auto button = notificationButton(key);
  if (place == _shown.end() || !button || !alertHasButton(place->second.alert, *button)) return;
  _answer(place, *button);
}

void NotificationScreen::_takeClosed(std::uint32_t number, std::uint32_t reason) {
  const Place place = _placeOf(number);
  if (place == _shown.end()) return;
  if (reason == kClosedByPerson) {
    _answer(place, AlertResponse::kCancelled);
  } else {
    _shown.erase(place);
    _restLater();
  }
}

void NotificationScreen::_answer(Place place, int button) {
  const auto over = _shown.extract(place);
  _restLater();
  over.mapped().handlers.onAnswer(AlertAnswer{button});
}

void NotificationScreen::_decline(Place place) {
  const auto over = _shown.extract(place);
  _restLater();
  over.mapped().handlers.onDeclined();
}

void NotificationScreen::_declineAll(bool newOnesAlone) {
  std::vector<std::string> ids;
  for (const auto& [id, shown] : _shown) {
    if (shown.number == 0 && !(newOnesAlone && shown.wasShown)) ids.push_back(id);
  }
  for (const std::string& id : ids) {
    const Place place = _shown.find(id);
    if (place != _shown.end()) _decline(place);
  }
}

void NotificationScreen::withdraw(const std::string& id) {
  const auto gone = _shown.extract(id);
  if (gone.empty()) return;
  _close(gone.mapped().number);
  _restLater();
}

void NotificationScreen::agentEnds() {
  for (const auto& [id, shown] : _shown) {
    if (!isNotice(shown.alert)) _close(shown.number);
  }
  _shown.clear();
}

/// With nothing on the screen nobody wakes us for other programs' notifications. Later: a proxy cannot go
/// within its own handler.
void NotificationScreen::_restLater() {
  if (!_shown.empty()) return;
  _host.mainLoop.post([this, alive = std::weak_ptr<bool>(_alive)] {
    if (alive.expired() || !_shown.empty()) return;
    _forgetServer();
    if (std::exchange(_isWatching, false)) _sessionBus.stopListening(kOwnerRule);
  });
}

void NotificationScreen::_complain(const std::string& reason) {
  if (std::exchange(_complained, true)) return;
  _host.log.warning("The notification server cannot show an alert: " + reason);
}

}  // namespace zal
