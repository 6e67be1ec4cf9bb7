#include "platform/linux/bus/telephony/ofono_signal_sampler.h"

#include <chrono>
#include <utility>

#include "platform/linux/bus/telephony/ofono_modems.h"

namespace zal {
namespace {

/// Of each of the three.
constexpr std::chrono::milliseconds kOfonoSampleLimit{200};

}  // namespace

void OfonoSignalSampler::sample(Telephony::SignalHandler handler) {
  if (_user == nullptr) {
    _user = _systemBus.addUser({.onConnected =
                                    [this](sdbus::IConnection& bus) {
                                      _connection = &bus;
                                      _bus = sdbus::createProxy(bus, "org.freedesktop.DBus",
                                                                "/org/freedesktop/DBus");
                                    },
                                .onLost =
                                    [this] {
                                      _network.reset();
                                      _manager.reset();
                                      _bus.reset();
                                      _connection = nullptr;
                                      _answer(std::nullopt);
                                    }});
  }
  // The wish for a connection makes one where there is none.
  if (_open || _systemBus.connection() == nullptr || _bus == nullptr) {
    handler(std::nullopt);
    return;
  }
  _open = std::move(handler);
  _ask([this] { _askForOwner(); });
}

/// Here a connection that was lost a moment ago shows.
template <typename Question>
void OfonoSignalSampler::_ask(Question question) {
  try {
    question();
  } catch (const sdbus::Error&) {
    _answer(std::nullopt);
  }
}

void OfonoSignalSampler::_askForOwner() {
  _bus->callMethodAsync("GetNameOwner")
      .onInterface("org.freedesktop.DBus")
      .withTimeout(kOfonoSampleLimit)
      .withArguments(std::string(kOfonoService))
      .uponReplyInvoke([this](const sdbus::Error* error, const std::string& owner) {
        if (error != nullptr) return _answer(std::nullopt);
        _ask([&] { _askForModems(owner); });
      });
}

/// Goes to the unique name: a question to the other one could start a daemon.
void OfonoSignalSampler::_askForModems(const std::string& owner) {
  _manager = sdbus::createProxy(*_connection, owner, "/");
  _manager->callMethodAsync("GetModems")
      .onInterface(ofonoInterface("Manager"))
      .withTimeout(kOfonoSampleLimit)
      .uponReplyInvoke([this, owner](const sdbus::Error* error, const OfonoModems& modems) {
        const auto* const modem = error == nullptr ? modemInUse(modems) : nullptr;
        if (modem == nullptr) return _answer(std::nullopt);
        _ask([&] { _askForNetwork(owner, modem->get<0>()); });
      });
}

void OfonoSignalSampler::_askForNetwork(const std::string& owner, const std::string& modem) {
  _network = sdbus::createProxy(*_connection, owner, modem);
  _network->callMethodAsync("GetProperties")
      .onInterface(ofonoInterface("NetworkRegistration"))
      .withTimeout(kOfonoSampleLimit)
      .uponReplyInvoke([this](const sdbus::Error* error, const OfonoProperties& network) {
        _answer(error == nullptr ? ofonoSignal(network) : std::nullopt);
      });
}

void OfonoSignalSampler::_answer(std::optional<CellularSignal> signal) {
  if (const auto handler = std::exchange(_open, nullptr)) handler(signal);
}

}  // namespace zal
