#pragma once

#include <sdbus-c++/sdbus-c++.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "platform/linux/bus/telephony/modem_state.h"
#include "tests/support/private_bus.h"

namespace zal::testing {

/// A service on a connection and a thread of its own, with whatever objects a test gives it: for what a
/// real modem daemon says only on other machines, or never should.
class PlayedService {
 public:
  /// One object; its properties and methods are added before publish().
  class Object {
   public:
    explicit Object(std::unique_ptr<sdbus::IObject> object) : _object(std::move(object)) {}
    template <class Type>
    Object& has(const std::string& interface, const std::string& name, Type value) {
      _object->registerProperty(name).onInterface(interface).withGetter([value] { return value; });
      return *this;
    }
    template <class Method>
    Object& answers(const std::string& interface, const std::string& name, Method method) {
      _object->registerMethod(name).onInterface(interface).implementedAs(std::move(method));
      return *this;
    }
    void publish() { _object->finishRegistration(); }

   private:
    std::unique_ptr<sdbus::IObject> _object;
  };

  /// `root` answers GetManagedObjects with the objects below it.
  PlayedService(const PrivateBus& bus, const std::string& name, const std::string& root)
      : _bus(sdbus::createSessionBusConnectionWithAddress(bus.address())) {
    _bus->addObjectManager(root, sdbus::floating_slot_t{});
    _bus->requestName(name);
    _bus->enterEventLoopAsync();
  }
  ~PlayedService() { _bus->leaveEventLoop(); }

  [[nodiscard]] std::unique_ptr<Object> object(const std::string& path) {
    return std::make_unique<Object>(sdbus::createObject(*_bus, path));
  }

 private:
  std::unique_ptr<sdbus::IConnection> _bus;
};

/// ModemManager with modems that are made by the test.
class PlayedModemManager : public PlayedService {
 public:
  using Modem = std::unique_ptr<Object>;
  explicit PlayedModemManager(const PrivateBus& bus) : PlayedService(bus, kModemManager, kModemManagerPath) {}

  [[nodiscard]] Modem modem(int number) {
    return object(std::string(kModemManagerPath) + "/Modem/" + std::to_string(number));
  }
  /// A modem with the state and the strength alone.
  [[nodiscard]] Modem plainModem(int number, std::int32_t state, std::uint32_t percentage) {
    Modem modem = this->modem(number);
    modem->has(kModem, "State", state);
    modem->has(kModem, "SignalQuality", sdbus::Struct<std::uint32_t, bool>{percentage, true});
    return modem;
  }
};

}  // namespace zal::testing
