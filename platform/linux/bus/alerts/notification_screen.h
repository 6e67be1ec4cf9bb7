#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <sdbus-c++/sdbus-c++.h>

#include "platform/linux/alerts/alert_screen.h"
#include "platform/linux/bus/alerts/notification_text.h"
#include "platform/linux/bus/bus_connection.h"

namespace zal {

/// Alerts as notifications with actions: org.freedesktop.Notifications on the session bus. Declined are
/// alerts with a text field, and all where no server runs (none is started for us), it has no actions or
/// does not answer. An alert whose server goes away is shown again by the next server. One that the
/// person closes is cancelled; one that the server lets go (it expired) waits on unseen. Main thread only.
class NotificationScreen : public AlertScreen {
 public:
  struct Limits {
    std::chrono::milliseconds call{1000};  ///< one answer of the server or the bus
    std::chrono::milliseconds patience{
        3000};  ///< from an alert to its place on the screen, connecting included
  };
  NotificationScreen(const BusHost& host, BusConnection& sessionBus, Limits limits);
  NotificationScreen(const BusHost& host, BusConnection& sessionBus)
      : NotificationScreen(host, sessionBus, Limits()) {}
  ~NotificationScreen() override;
  NotificationScreen(const NotificationScreen&) = delete;
  NotificationScreen& operator=(const NotificationScreen&) = delete;

  void present(const std::string& id, const UserAlert& alert, AlertHandlers handlers) override;
  void withdraw(const std::string& id) override;
  void agentEnds() override;

 private:
  struct Server {
    std::string uniqueName;  ///< on this bus
    std::unique_ptr<sdbus::IProxy> proxy = {};
    std::optional<NotificationAbilities> abilities = {};
    bool isAsked = false;  ///< for its abilities
  };
  struct Shown {
    UserAlert alert;
    AlertHandlers handlers;
    std::uint32_t number = 0;  ///< the server's; 0: it does not show it
    bool isAsked = false;      ///< a Notify is on its way
    bool wasShown = false;     ///< by this server or one before it
    ScopedTimer patience = {};
  };
  using Place = std::map<std::string, Shown>::iterator;
  void _join(sdbus::IConnection& bus);
  void _leave();
  void _lookForServer();
  void _askOwner();
  void _takeOwnerChange(sdbus::Message& signal);
  void _takeServer(const std::string& uniqueName);
  void _takeServerSignal(sdbus::Message& signal);
  void _askCapabilities();
  void _takeCapabilities(const sdbus::Error* error, const std::vector<std::string>& capabilities);
  void _forgetServer();
  void _loseServer();
  void _notifyAll();
  void _notify(Place place);
  void _takeNumber(const std::string& id, const sdbus::Error* error, std::uint32_t number);
  void _close(std::uint32_t number);
  [[nodiscard]] Place _placeOf(std::uint32_t number);
  void _takeAction(std::uint32_t number, const std::string& key);
  void _takeClosed(std::uint32_t number, std::uint32_t reason);
  void _answer(Place place, int button);
  void _decline(Place place);
  void _declineAll(bool newOnesAlone);
  void _restLater();
  void _complain(const std::string& reason);

  const BusHost& _host;
  BusConnection& _sessionBus;
  const Limits _limits;
  std::map<std::string, Shown> _shown;
  std::unique_ptr<sdbus::IProxy> _daemon;
  sdbus::IConnection* _bus = nullptr;
  bool _isWatching = false;  // who has the servers' name
  std::string _busId;        // empty until this connection's bus has told it
  std::optional<Server> _server;
  std::string _numbersOf;  // whose numbers are in _shown: bus and unique name
  bool _complained = false;
  std::unique_ptr<BusConnection::User> _user;
  std::shared_ptr<bool> _alive = std::make_shared<bool>(true);  // dies first: guards tasks in flight
};

}  // namespace zal
