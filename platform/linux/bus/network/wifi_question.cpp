#include "platform/linux/bus/network/wifi_question.h"

#include <algorithm>
#include <utility>

namespace zal {
namespace {

constexpr std::uint32_t kWifiDevice = 2;
/// Machines with containers have a device for each; a phone has some ten.
constexpr std::size_t kMostDevices = 64;

bool isWell(BusTrouble trouble) { return trouble == BusTrouble::none || trouble == BusTrouble::refused; }

}  // namespace

void WifiQuestion::begin(BusConversation& bus, std::function<void()> done) {
  _bus = &bus;
  _done = std::move(done);
  _calls.expect(2, [this] {
    if (_manager) return _askManager();
    if (_manager.trouble != BusTrouble::noOwner) return _done();
    if (_supplicant) return _askSupplicantAlone();
    if (_supplicant.trouble == BusTrouble::noOwner) _isAssociated = false;
    _done();
  });
  bus.ownerOf("org.freedesktop.NetworkManager", [this](const BusAnswer<std::string>& owner) {
    _manager = owner;
    _calls.arrive();
  });
  bus.ownerOf("fi.w1.wpa_supplicant1", [this](const BusAnswer<std::string>& owner) {
    _supplicant = owner;
    _calls.arrive();
  });
}

void WifiQuestion::_askManager() {
  _bus->ask<std::vector<sdbus::ObjectPath>>(
      {_manager.value, "/org/freedesktop/NetworkManager", "org.freedesktop.NetworkManager", "GetDevices"},
      [this](const BusAnswer<std::vector<sdbus::ObjectPath>>& devices) {
        _worst = devices.trouble;
        if (!devices) return _endManager();
        _askKinds(devices.value);
      });
}

void WifiQuestion::_askKinds(const std::vector<sdbus::ObjectPath>& paths) {
  for (const sdbus::ObjectPath& path : paths) {
    if (_devices.size() < kMostDevices) _devices.push_back({.path = path, .interface = {}});
  }
  _calls.expect(_devices.size(), [this] { _askAssociations(); });
  for (Device& device : _devices) {
    _bus->allProperties(
        _manager.value, device.path, "org.freedesktop.NetworkManager.Device",
        [this, &device](const BusAnswer<BusProperties>& properties) {
          BusTrouble trouble = properties.trouble;
          device.isWifi = propertyOf<std::uint32_t>(properties.value, "DeviceType", trouble) == kWifiDevice;
          device.interface = propertyOf<std::string>(properties.value, "Interface", trouble).value_or("");
          _arrive(trouble);
        });
  }
}

void WifiQuestion::_askAssociations() {
  std::erase_if(_devices, [](const Device& device) { return !device.isWifi; });
  std::stable_partition(_devices.begin(), _devices.end(),
                        [this](const Device& device) { return device.interface == _preferred; });
  _calls.expect(_devices.size(), [this] {
    const auto associated = std::find_if(_devices.begin(), _devices.end(),
                                         [](const Device& device) { return !device.accessPoint.empty(); });
    if (associated == _devices.end()) return _endManager();
    _askDetails(*associated);
  });
  for (Device& device : _devices) {
    _bus->allProperties(_manager.value, device.path, "org.freedesktop.NetworkManager.Device.Wireless",
                        [this, &device](const BusAnswer<BusProperties>& properties) {
                          BusTrouble trouble = properties.trouble;
                          const auto accessPoint =
                              propertyOf<sdbus::ObjectPath>(properties.value, "ActiveAccessPoint", trouble);
                          if (accessPoint && *accessPoint != "/") device.accessPoint = *accessPoint;
                          device.bitRate = propertyOf<std::uint32_t>(properties.value, "Bitrate", trouble);
                          _arrive(trouble);
                        });
  }
}

void WifiQuestion::_askDetails(const Device& device) {
  _values.bitRate = device.bitRate;
  _calls.expect(_supplicant ? 2 : 1, [this] { _done(); });
  _bus->property<std::uint8_t>(_manager.value, device.accessPoint,
                               "org.freedesktop.NetworkManager.AccessPoint", "Strength",
                               [this](const BusAnswer<std::uint8_t>& strength) {
                                 if (strength) _values.strength = strength.value;
                                 if (strength.trouble != BusTrouble::silent) _isAssociated = true;
                                 _hasManagerSpoken = true;
                                 _arrive(strength.trouble);
                               });
  if (!_supplicant) return;
  _isLinkAsked = true;
  _link.poll(*_bus, _supplicant.value, device.interface, [this] { _calls.arrive(); });
}

void WifiQuestion::_askSupplicantAlone() {
  _isLinkAsked = true;
  _link.explore(*_bus, _supplicant.value, _preferred, [this] {
    if (_link.isAssociated() || isWell(_link.trouble())) _isAssociated = _link.isAssociated();
    _done();
  });
}

void WifiQuestion::_arrive(BusTrouble trouble) {
  _worst = std::max(_worst, trouble);
  _calls.arrive();
}

void WifiQuestion::_endManager() {
  _hasManagerSpoken = true;
  if (isWell(_worst)) _isAssociated = false;
  _done();
}

std::optional<WifiSignal> WifiQuestion::signal() const {
  if (!_isAssociated) return std::nullopt;
  if (!*_isAssociated) return WifiSignal{};
  WifiValues values = _values;
  _link.addTo(values);
  return associatedSignal(values);
}

std::optional<BusTrouble> WifiQuestion::managerTrouble() const {
  if (_manager.trouble == BusTrouble::silent) return std::nullopt;
  if (!_manager) return _manager.trouble;
  return _hasManagerSpoken ? _worst : BusTrouble::silent;
}

std::optional<BusTrouble> WifiQuestion::supplicantTrouble() const {
  if (_supplicant.trouble == BusTrouble::noOwner) return BusTrouble::noOwner;
  return _isLinkAsked ? std::optional(_link.trouble()) : std::nullopt;
}

}  // namespace zal
