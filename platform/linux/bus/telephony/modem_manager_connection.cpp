#include "platform/linux/bus/telephony/modem_manager_connection.h"

#include <chrono>
#include <optional>
#include <string>
#include <utility>

#include "platform/linux/bus/bus_peer.h"
#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus/telephony/modem_answers.h"
#include "platform/linux/bus/telephony/modem_state.h"

namespace zal {
namespace {

constexpr const char* kNetworkManager = "org.freedesktop.NetworkManager";
constexpr const char* kNetworkManagerPath = "/org/freedesktop/NetworkManager";

/// For what ModemManager hands on to its modem.
constexpr std::chrono::milliseconds kModemLimit{2000};
/// What the modem itself may take for an answer, in the seconds of Command.
constexpr std::uint32_t kCommandSeconds = 1;
/// Location sources are a bit set: the cells of 3GPP networks.
constexpr std::uint32_t kCellLocation = 1;

class ModemManagerConnection : public TelephonyConnection {
 public:
  ModemManagerConnection(std::unique_ptr<sdbus::IConnection> bus, const std::string& owner,
                         const BusHost& host)
      : _host(host),
        _bus(std::move(bus)),
        _modemManager(*_bus, owner, "ModemManager", host.clock, host.log) {}

  [[nodiscard]] std::optional<CellularSignal> signalStrength() override { return modemSignal(_state()); }

  [[nodiscard]] std::optional<CellularAnswer> query(CellularQuery query) override {
    if (query == CellularQuery::bootloaderVersion) {
      return _ask(kModemFirmware, "List", &bootloaderAnswer);
    }
    if (query == CellularQuery::serviceCenterAddress) {
      return _ask(kModem, "Command", &serviceCenterAnswer, "AT+CSCA?", kCommandSeconds);
    }
    if (query == CellularQuery::servingCellId) return _servingCell();
    return modemAnswer(query, _state());
  }

  void dumpBasebandState(std::string_view reason) override { _host.startBasebandDump(reason); }

 private:
  using Reader = std::optional<CellularAnswer>(const ValueList& values);

  template <class... Arguments>
  std::optional<CellularAnswer> _ask(const char* interface, const char* method, Reader* read,
                                     const Arguments&... arguments) {
    const ModemState& modem = _state();
    if (modem.path.empty()) return std::nullopt;
    const auto values = _modemManager.call({modem.path, interface, method}, kModemLimit, arguments...);
    return values ? read(*values) : std::nullopt;
  }

  std::optional<CellularAnswer> _servingCell() {
    const ModemState& modem = _state();
    const auto* const enabled = modem.property<std::uint64_t>(kModemLocation, "Enabled");
    if (enabled == nullptr) return std::nullopt;
    if ((*enabled & kCellLocation) == 0 && !_locateCells(static_cast<std::uint32_t>(*enabled))) {
      return std::nullopt;
    }
    return _ask(kModemLocation, "GetLocation", &servingCellAnswer);
  }

  /// The sources that others use stay as they are.
  bool _locateCells(std::uint32_t enabled) {
    const ModemState& modem = _state();
    const bool* const signals = modem.property<bool>(kModemLocation, "SignalsLocation");
    return _modemManager
        .call({modem.path, kModemLocation, "Setup"}, kModemLimit, enabled | kCellLocation,
              signals != nullptr && *signals)
        .has_value();
  }

  const ModemState& _state() {
    if (!_modem) _modem = _read();
    return *_modem;
  }

  ModemState _read() {
    const auto objects = _modemManager.call(
        {kModemManagerPath, "org.freedesktop.DBus.ObjectManager", "GetManagedObjects"}, kAnswerLimit);
    const auto* const map = objects && !objects->empty() ? objects->front().as<ValueMap>() : nullptr;
    if (map == nullptr) return {};
    ModemState modem = modemInUse(*map);
    // Cards and bearers are no objects of the manager, only paths in their modem's properties.
    if (const auto* const card = modem.property<std::string>(kModem, "Sim");
        card != nullptr && !modem.isWithoutSim()) {
      modem.sim = _modemManager.properties(*card, kSim);
    }
    for (const std::string& bearer : modem.bearerPaths()) {
      modem.bearers.push_back(_modemManager.properties(bearer, kBearer));
    }
    _readNetworkManager(modem);
    return modem;
  }

  void _readNetworkManager(ModemState& modem) {
    const auto owner = ownerOf(*_bus, kNetworkManager);
    modem.hasNetworkManager = owner.has_value();
    if (!owner) return;
    BusPeer networkManager(*_bus, *owner, "NetworkManager", _host.clock, _host.log);
    modem.networkManager = networkManager.properties(kNetworkManagerPath, kNetworkManager);
  }

  const BusHost& _host;
  const std::unique_ptr<sdbus::IConnection> _bus;
  BusPeer _modemManager;
  std::optional<ModemState> _modem;
};

}  // namespace

std::unique_ptr<TelephonyConnection> openModemManager(std::unique_ptr<sdbus::IConnection> bus,
                                                      const std::string& owner, const BusHost& host) {
  return std::make_unique<ModemManagerConnection>(std::move(bus), owner, host);
}

}  // namespace zal
