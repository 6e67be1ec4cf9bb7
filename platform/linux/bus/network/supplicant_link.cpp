#include "platform/linux/bus/network/supplicant_link.h"

#include <algorithm>
#include <utility>

namespace zal {
namespace {

constexpr const char* kSupplicant = "fi.w1.wpa_supplicant1";
constexpr const char* kSupplicantInterface = "fi.w1.wpa_supplicant1.Interface";
constexpr const char* kNoBss = "/";

}  // namespace

void SupplicantLink::poll(BusConversation& bus, std::string owner, const std::string& interface,
                          std::function<void()> done) {
  _bus = &bus;
  _owner = std::move(owner);
  _done = std::move(done);
  _find(interface, [this] {
    _calls.expect(1, [this] { _finish(); });
    _poll();
  });
}

void SupplicantLink::explore(BusConversation& bus, std::string owner, const std::string& interface,
                             std::function<void()> done) {
  _bus = &bus;
  _owner = std::move(owner);
  _done = std::move(done);
  _find(interface, [this] { _askAssociation(); });
}

void SupplicantLink::addTo(WifiValues& values) const {
  values.polledRssi = _values.polledRssi;
  values.scanRssi = _values.scanRssi;
  values.linkSpeed = _values.linkSpeed;
}

void SupplicantLink::_find(const std::string& interface, std::function<void()> next) {
  _bus->ask<sdbus::ObjectPath>(
      {_owner, "/fi/w1/wpa_supplicant1", kSupplicant, "GetInterface"},
      [this, next = std::move(next)](const BusAnswer<sdbus::ObjectPath>& found) {
        _worst = found.trouble;
        if (!found) return _finish();
        _path = found.value;
        next();
      },
      interface);
}

void SupplicantLink::_askAssociation() {
  _calls.expect(2, [this] {
    _isAssociated = _isCompleted && _bss != kNoBss;
    if (!_isAssociated) return _finish();
    _calls.expect(2, [this] { _finish(); });
    _poll();
    _bus->property<std::int16_t>(_owner, _bss, "fi.w1.wpa_supplicant1.BSS", "Signal",
                                 [this](const BusAnswer<std::int16_t>& signal) {
                                   if (signal) _values.scanRssi = signal.value;
                                   _arrive(signal.trouble);
                                 });
  });
  _bus->property<std::string>(_owner, _path, kSupplicantInterface, "State",
                              [this](const BusAnswer<std::string>& state) {
                                _isCompleted = state.value == "completed";
                                _arrive(state.trouble);
                              });
  _bus->property<sdbus::ObjectPath>(_owner, _path, kSupplicantInterface, "CurrentBSS",
                                    [this](const BusAnswer<sdbus::ObjectPath>& bss) {
                                      if (bss) _bss = bss.value;
                                      _arrive(bss.trouble);
                                    });
}

void SupplicantLink::_poll() {
  // Its answer is a dictionary by its own description, and in truth a variant that holds one.
  _bus->ask<LooseDictionary>(
      {_owner, _path, kSupplicantInterface, "SignalPoll"}, [this](const BusAnswer<LooseDictionary>& poll) {
        BusTrouble trouble = poll.trouble;
        _values.polledRssi = propertyOf<std::int32_t>(poll.value.values, "rssi", trouble);
        _values.linkSpeed = propertyOf<std::int32_t>(poll.value.values, "linkspeed", trouble);
        _arrive(trouble);
      });
}

void SupplicantLink::_arrive(BusTrouble trouble) {
  _worst = std::max(_worst, trouble);
  _calls.arrive();
}

void SupplicantLink::_finish() {
  _trouble = _worst;
  _done();
}

}  // namespace zal
