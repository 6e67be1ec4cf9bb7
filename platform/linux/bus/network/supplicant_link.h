#pragma once

#include <functional>
#include <string>

#include "platform/linux/bus/bus_conversation.h"
#include "platform/linux/bus/call_group.h"
#include "platform/linux/bus/network/wifi_values.h"

namespace zal {

/// What wpa_supplicant knows of one interface's association. Main thread only.
class SupplicantLink {
 public:
  /// Polls the driver, for an interface that somebody else knows to be associated. `done` comes once,
  /// perhaps at once; the conversation outlives the calls.
  void poll(BusConversation& bus, std::string owner, const std::string& interface,
            std::function<void()> done);
  /// Asks whether it is associated too, and if so what the last scan heard.
  void explore(BusConversation& bus, std::string owner, const std::string& interface,
               std::function<void()> done);

  /// How it fared: silent until it is done.
  [[nodiscard]] BusTrouble trouble() const { return _trouble; }
  [[nodiscard]] bool isAssociated() const { return _isAssociated; }
  /// Takes what is known into the values.
  void addTo(WifiValues& values) const;

 private:
  void _find(const std::string& interface, std::function<void()> next);
  void _askAssociation();
  void _poll();
  void _arrive(BusTrouble trouble);
  void _finish();

  BusConversation* _bus = nullptr;
  std::string _owner;
  std::function<void()> _done;
  CallGroup _calls;
  BusTrouble _worst = BusTrouble::none;
  BusTrouble _trouble = BusTrouble::silent;
  std::string _path;       // of the interface
  std::string _bss = "/";  // which is none
  bool _isCompleted = false;
  bool _isAssociated = false;
  WifiValues _values;
};

}  // namespace zal
