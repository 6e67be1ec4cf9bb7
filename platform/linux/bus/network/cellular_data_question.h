#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "platform/linux/bus/bus_inquiry.h"
#include "platform/linux/bus/call_group.h"
#include "platform/linux/bus_module/cellular_data_status.h"

namespace zal {

/// ModemManager's objects as GetManagedObjects gives them: path, interface, property.
using ModemObjects = std::map<sdbus::ObjectPath, std::map<std::string, BusProperties>>;

/// All modems of ModemManager together.
struct ModemSummary {
  bool isThere = false;
  bool isRegistered = false;  ///< one of them is, at home or roaming
  bool isConnected = false;   ///< one of these carries data
};
/// A modem without 3GPP is registered by its state; values of another type count as not there.
[[nodiscard]] ModemSummary modemSummary(const ModemObjects& objects);

/// Whether a modem is registered and data switched on. ModemManager is asked first, with
/// NetworkManager's switch, or where there is none whether a modem is connected; oFono where
/// ModemManager has no modem or no answer. Main thread only.
class CellularDataQuestion : public BusQuestion {
 public:
  void begin(BusConversation& bus, std::function<void()> done) override;
  /// As far as it is known by now.
  [[nodiscard]] CellularData answer() const { return _answer; }

 private:
  void _askModemManager();
  void _askSwitch(const ModemSummary& modems);
  /// Where there is no oFono, that is the answer.
  void _askOfonoElse(CellularData otherwise);
  void _askOfonoModem(const std::string& path);
  void _end(CellularData answer);

  struct OfonoModem {
    bool isRegistered = false;
    bool isPowered = false;
  };

  BusConversation* _bus = nullptr;
  std::function<void()> _done;
  CallGroup _calls;
  BusAnswer<std::string> _modemManager;
  BusAnswer<std::string> _networkManager;
  BusAnswer<std::string> _ofono;
  std::map<std::string, OfonoModem> _ofonoModems;
  bool _isOfonoSilent = false;
  CellularData _answer = CellularData::noAnswer;
};

}  // namespace zal
