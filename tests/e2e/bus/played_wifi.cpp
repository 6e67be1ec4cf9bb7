#include "tests/e2e/bus/played_wifi.h"

#include <algorithm>

namespace zal::testing {
namespace {

constexpr const char* kPoll = "/supplicant/0 fi.w1.wpa_supplicant1.Interface.SignalPoll";

PlayedDaemon::Answers managerOf(const PlayedWifi::Signal& signal) {
  PlayedDaemon::Answers answers = {
      {"/org/freedesktop/NetworkManager org.freedesktop.NetworkManager.GetDevices", "(@ao ['/device'],)"}};
  answers.merge(playedProperties("/device", "org.freedesktop.NetworkManager.Device",
                                 {{"DeviceType", "uint32 2"}, {"Interface", "'wlan0'"}}));
  answers.merge(playedProperties("/device", "org.freedesktop.NetworkManager.Device.Wireless",
                                 {{"ActiveAccessPoint", "objectpath '/point'"},
                                  {"Bitrate", "uint32 " + std::to_string(signal.rate * 1000)}}));
  answers.merge(playedProperties("/point", "org.freedesktop.NetworkManager.AccessPoint",
                                 {{"Strength", "byte " + std::to_string(signal.strength)}}));
  return answers;
}

std::string pollOf(const PlayedWifi::Signal& signal) {
  return "(<{'rssi': <" + std::to_string(signal.rssi) + ">, 'linkspeed': <" + std::to_string(signal.rate) +
         ">}>,)";
}

}  // namespace

PlayedWifi::PlayedWifi(const PrivateBus& bus, const Signal& signal)
    : _manager(bus, "org.freedesktop.NetworkManager", managerOf(signal)),
      _supplicant(bus, "fi.w1.wpa_supplicant1",
                  {{R"(/fi/w1/wpa_supplicant1 fi.w1.wpa_supplicant1.GetInterface("wlan0"))",
                    "(objectpath '/supplicant/0',)"},
                   {kPoll, pollOf(signal)}}) {}

void PlayedWifi::set(const Signal& signal) {
  for (const auto& [call, answer] : managerOf(signal)) _manager.answer(call, answer);
  _supplicant.answer(kPoll, pollOf(signal));
}

std::size_t PlayedWifi::polls() const {
  const auto calls = _supplicant.calls();
  return static_cast<std::size_t>(std::count_if(calls.begin(), calls.end(), [](const std::string& call) {
    return call.find("SignalPoll") != std::string::npos;
  }));
}

}  // namespace zal::testing
