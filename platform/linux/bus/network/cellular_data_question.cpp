#include "platform/linux/bus/network/cellular_data_question.h"

#include <algorithm>
#include <cstdint>
#include <tuple>
#include <utility>

namespace zal {
namespace {

constexpr const char* kOfonoRegistration = "org.ofono.NetworkRegistration";
constexpr const char* kOfonoData = "org.ofono.ConnectionManager";
constexpr std::size_t kMostOfonoModems = 16;

bool isRegisteredFor3gpp(std::uint32_t registration) {
  constexpr std::uint32_t kHome = 1;
  constexpr std::uint32_t kRoaming = 5;
  return registration == kHome || registration == kRoaming;
}

}  // namespace

ModemSummary modemSummary(const ModemObjects& objects) {
  constexpr std::int32_t kRegisteredState = 8;
  constexpr std::int32_t kConnectedState = 11;
  const std::string modemInterface = "org.freedesktop.ModemManager1.Modem";
  ModemSummary summary;
  BusTrouble trouble = BusTrouble::none;
  for (const auto& [path, interfaces] : objects) {
    const auto modem = interfaces.find(modemInterface);
    if (modem == interfaces.end()) continue;
    summary.isThere = true;
    const std::int32_t state = propertyOf<std::int32_t>(modem->second, "State", trouble).value_or(0);
    const auto cellular = interfaces.find(modemInterface + ".Modem3gpp");
    const bool isRegistered =
        cellular == interfaces.end()
            ? state >= kRegisteredState
            : isRegisteredFor3gpp(
                  propertyOf<std::uint32_t>(cellular->second, "RegistrationState", trouble).value_or(0));
    summary.isRegistered |= isRegistered;
    summary.isConnected |= isRegistered && state == kConnectedState;
  }
  return summary;
}

void CellularDataQuestion::begin(BusConversation& bus, std::function<void()> done) {
  _bus = &bus;
  _done = std::move(done);
  _calls.expect(3, [this] {
    if (_modemManager) return _askModemManager();
    const bool isNobodyThere = _modemManager.trouble == BusTrouble::noOwner;
    _askOfonoElse(isNobodyThere ? CellularData::noService : CellularData::noAnswer);
  });
  const std::pair<const char*, BusAnswer<std::string>*> names[] = {
      {"org.freedesktop.ModemManager1", &_modemManager},
      {"org.freedesktop.NetworkManager", &_networkManager},
      {"org.ofono", &_ofono}};
  for (const auto& name : names) {
    bus.ownerOf(name.first, [this, answer = name.second](const BusAnswer<std::string>& owner) {
      *answer = owner;
      _calls.arrive();
    });
  }
}

void CellularDataQuestion::_askModemManager() {
  _bus->ask<ModemObjects>({_modemManager.value, "/org/freedesktop/ModemManager1",
                           "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"},
                          [this](const BusAnswer<ModemObjects>& objects) {
                            if (!objects) return _askOfonoElse(CellularData::noAnswer);
                            const ModemSummary modems = modemSummary(objects.value);
                            if (!modems.isThere) return _askOfonoElse(CellularData::unavailable);
                            if (!modems.isRegistered) return _end(CellularData::unavailable);
                            _askSwitch(modems);
                          });
}

void CellularDataQuestion::_askSwitch(const ModemSummary& modems) {
  const CellularData byConnection = modems.isConnected ? CellularData::available : CellularData::unavailable;
  if (!_networkManager) return _end(byConnection);
  _bus->property<bool>(_networkManager.value, "/org/freedesktop/NetworkManager",
                       "org.freedesktop.NetworkManager", "WwanEnabled",
                       [this, byConnection](const BusAnswer<bool>& isOn) {
                         if (!isOn) return _end(byConnection);
                         _end(isOn.value ? CellularData::available : CellularData::unavailable);
                       });
}

void CellularDataQuestion::_askOfonoElse(CellularData otherwise) {
  using Modems = std::vector<sdbus::Struct<sdbus::ObjectPath, BusProperties>>;
  if (!_ofono) return _end(otherwise);
  _bus->ask<Modems>(
      {_ofono.value, "/", "org.ofono.Manager", "GetModems"}, [this](const BusAnswer<Modems>& modems) {
        if (!modems) return _end(CellularData::noAnswer);
        for (const auto& modem : modems.value) {
          if (_ofonoModems.size() < kMostOfonoModems) _ofonoModems[std::get<0>(modem)] = {};
        }
        _calls.expect(_ofonoModems.size() * 2, [this] {
          const bool isOne = std::any_of(_ofonoModems.begin(), _ofonoModems.end(), [](const auto& modem) {
            return modem.second.isRegistered && modem.second.isPowered;
          });
          if (isOne) return _end(CellularData::available);
          _end(_isOfonoSilent ? CellularData::noAnswer : CellularData::unavailable);
        });
        for (const auto& modem : _ofonoModems) _askOfonoModem(modem.first);
      });
}

// A modem that is off has neither interface and refuses.
void CellularDataQuestion::_askOfonoModem(const std::string& path) {
  _bus->ask<BusProperties>({_ofono.value, path, kOfonoRegistration, "GetProperties"},
                           [this, path](const BusAnswer<BusProperties>& properties) {
                             BusTrouble trouble = properties.trouble;
                             const auto status = propertyOf<std::string>(properties.value, "Status", trouble);
                             _ofonoModems[path].isRegistered = status == "registered" || status == "roaming";
                             _isOfonoSilent |= trouble == BusTrouble::silent;
                             _calls.arrive();
                           });
  _bus->ask<BusProperties>({_ofono.value, path, kOfonoData, "GetProperties"},
                           [this, path](const BusAnswer<BusProperties>& properties) {
                             BusTrouble trouble = properties.trouble;
                             _ofonoModems[path].isPowered =
                                 propertyOf<bool>(properties.value, "Powered", trouble).value_or(false);
                             _isOfonoSilent |= trouble == BusTrouble::silent;
                             _calls.arrive();
                           });
}

void CellularDataQuestion::_end(CellularData answer) {
  _answer = answer;
  _done();
}

}  // namespace zal
