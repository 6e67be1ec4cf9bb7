#include "platform/linux/bus/telephony/modem_manager_sampler.h"

#include <chrono>
#include <utility>

#include "platform/linux/bus/bus_value.h"
#include "platform/linux/bus/telephony/modem_state.h"

namespace zal {
namespace {

constexpr std::chrono::milliseconds kOwnerLimit{200};
constexpr std::chrono::milliseconds kModemsLimit{400};

}  // namespace

void ModemManagerSampler::sample(Handler handler) {
  _open = std::move(handler);
  if (_user == nullptr) {
    _user = _systemBus.addUser({.onConnected =
                                    [this](sdbus::IConnection& bus) {
                                      _bus = sdbus::createProxy(bus, "org.freedesktop.DBus",
                                                                "/org/freedesktop/DBus");
                                      if (_open) _askForOwner();
                                    },
                                .onLost =
                                    [this] {
                                      _manager.reset();
                                      _bus.reset();
                                      _owner.clear();
                                      _answer({.trouble = kBusSilent});
                                    }});
  } else if (_systemBus.connection() != nullptr && _bus != nullptr) {
    _try([this] { _askForOwner(); });
  }
}

/// A connection that is lost without a word so far shows with the next question.
template <class Question>
void ModemManagerSampler::_try(Question question) {
  try {
    question();
  } catch (const sdbus::Error&) {
    _answer({.trouble = kBusSilent});
  }
}

void ModemManagerSampler::_askForOwner() {
  _bus->callMethodAsync("GetNameOwner")
      .onInterface("org.freedesktop.DBus")
      .withTimeout(kOwnerLimit)
      .withArguments(std::string(kModemManager))
      .uponReplyInvoke([this](const sdbus::Error* error, const std::string& owner) {
        if (!_open) return;
        if (error == nullptr) {
          _try([&] { _askForModems(owner); });
        } else if (error->getName() == "org.freedesktop.DBus.Error.NameHasNoOwner") {
          _answer({});
        } else {
          _answer({.trouble = kBusSilent});
        }
      });
}

void ModemManagerSampler::_askForModems(const std::string& owner) {
  if (std::exchange(_owner, owner) != owner || _manager == nullptr) {
    _manager = sdbus::createProxy(*_systemBus.connection(), owner, kModemManagerPath);
  }
  const auto question = _manager->createMethodCall("org.freedesktop.DBus.ObjectManager", "GetManagedObjects");
  (void)_manager->callMethod(
      question,
      [this](sdbus::MethodReply& reply, const sdbus::Error* error) {
        if (_open) _try([&] { _readModems(reply, error); });
      },
      kModemsLimit);
}

void ModemManagerSampler::_readModems(sdbus::MethodReply& reply, const sdbus::Error* error) {
  Sample sample{.isThere = true};
  if (error != nullptr) {
    sample.trouble = "ModemManager does not answer";
    _answer(sample);
    return;
  }
  const ValueList values = readValues(reply);
  const auto* const objects = values.empty() ? nullptr : values.front().as<ValueMap>();
  const ModemState modem = objects != nullptr ? modemInUse(*objects) : ModemState{};
  sample.signal = modemSignal(modem);
  if (modem.path.empty()) {
    sample.trouble = "ModemManager has no modem";
  } else if (!sample.signal) {
    sample.trouble = "ModemManager's modem tells no signal";
  }
  _answer(sample);
}

void ModemManagerSampler::_answer(const Sample& sample) {
  if (const auto handler = std::exchange(_open, nullptr)) handler(sample);
}

}  // namespace zal
