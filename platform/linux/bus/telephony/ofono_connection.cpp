#include "platform/linux/bus/telephony/ofono_connection.h"

#include <chrono>
#include <map>
#include <optional>
#include <string>
#include <utility>

#include "platform/linux/bus/private_bus.h"
#include "platform/linux/bus/telephony/ofono_answers.h"
#include "platform/linux/bus/telephony/ofono_modems.h"

namespace zal {
namespace {

/// A daemon answers this by itself, whatever its modem is busy with.
constexpr std::chrono::milliseconds kPingLimit{200};

class OfonoConnection : public TelephonyConnection {
 public:
  OfonoConnection(std::unique_ptr<sdbus::IConnection> bus, std::string owner,
                  std::function<void(std::string_view)> dumpBaseband)
      : _bus(std::move(bus)), _owner(std::move(owner)), _dumpBaseband(std::move(dumpBaseband)) {}

  [[nodiscard]] std::optional<CellularSignal> signalStrength() override {
    const OfonoProperties* const network = _properties("NetworkRegistration");
    return network != nullptr ? ofonoSignal(*network) : std::nullopt;
  }

  [[nodiscard]] std::optional<CellularAnswer> query(CellularQuery query) override {
    if (query == CellularQuery::packetContextCount) return _packetContextCount();
    return ofonoAnswer(query, [this](const std::string& name) { return _properties(name); });
  }

  void dumpBasebandState(std::string_view reason) override { _dumpBaseband(reason); }

 private:
  template <typename Result>
  std::optional<Result> _call(const std::string& path, const std::string& interface,
                              const std::string& method) {
    if (_isSilent) return std::nullopt;
    try {
      Result result{};
      sdbus::createProxy(*_bus, _owner, path)
          ->callMethod(method)
          .onInterface(interface)
          .withTimeout(kAnswerLimit)
          .storeResultsTo(result);
      return result;
    } catch (const sdbus::Error& error) {
      // Some interfaces ask the modem first: one that is slow is no reason to give up the others.
      _isSilent = error.getName() == "org.freedesktop.DBus.Error.Timeout" && !_answersPings();
      return std::nullopt;
    }
  }

  bool _answersPings() {
    try {
      sdbus::createProxy(*_bus, _owner, "/")
          ->callMethod("Ping")
          .onInterface("org.freedesktop.DBus.Peer")
          .withTimeout(kPingLimit);
      return true;
    } catch (const sdbus::Error&) {
      return false;
    }
  }

  /// The modem's object path; empty while there is no modem. Asked for once.
  const std::string& _modem() {
    if (_modemPath) return *_modemPath;
    _modemPath.emplace();
    const auto modems = _call<OfonoModems>("/", ofonoInterface("Manager"), "GetModems");
    if (const auto* const modem = modems ? modemInUse(*modems) : nullptr) {
      *_modemPath = modem->get<0>();
      _interfaces["Modem"] = modem->get<1>();
    }
    return *_modemPath;
  }

  const OfonoProperties* _properties(const std::string& name) {
    const std::string& modem = _modem();
    if (modem.empty()) return nullptr;
    auto found = _interfaces.find(name);
    if (found == _interfaces.end()) {
      found = _interfaces.emplace(name, _call<OfonoProperties>(modem, ofonoInterface(name), "GetProperties"))
                  .first;
    }
    return found->second ? &*found->second : nullptr;
  }

  std::optional<CellularAnswer> _packetContextCount() {
    const std::string& modem = _modem();
    if (modem.empty()) return std::nullopt;
    const auto contexts = _call<OfonoModems>(modem, ofonoInterface("ConnectionManager"), "GetContexts");
    if (!contexts) return std::nullopt;
    return CellularAnswer{static_cast<std::int64_t>(contexts->size()), {}};
  }

  const std::unique_ptr<sdbus::IConnection> _bus;
  const std::string _owner;  ///< its unique name: a call to the other one could start a daemon
  const std::function<void(std::string_view)> _dumpBaseband;
  bool _isSilent = false;
  std::optional<std::string> _modemPath;
  std::map<std::string, std::optional<OfonoProperties>> _interfaces;  ///< nothing: it has no such one
};

}  // namespace

std::unique_ptr<TelephonyConnection> openOfono(std::unique_ptr<sdbus::IConnection> bus,
                                               std::function<void(std::string_view)> dumpBaseband) {
  auto owner = ownerOf(*bus, kOfonoService);
  if (!owner) return nullptr;
  return std::make_unique<OfonoConnection>(std::move(bus), std::move(*owner), std::move(dumpBaseband));
}

}  // namespace zal
