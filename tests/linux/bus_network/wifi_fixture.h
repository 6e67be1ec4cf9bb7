#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/linux/bus/network/bus_network_status.h"
#include "tests/linux/bus/bus_fixture.h"
#include "tests/support/played_daemon.h"

namespace zal::testing {

/// The Wi-Fi's status on a private bus, with daemons that are played.
class WifiFixture : public BusFixture {
 protected:
  using Lines = std::vector<std::string>;
  using Answers = PlayedDaemon::Answers;
  static constexpr const char* kManager = "org.freedesktop.NetworkManager";
  static constexpr const char* kSupplicant = "fi.w1.wpa_supplicant1";
  static constexpr const char* kNothing = "nothing";
  static constexpr const char* kNotAssociated = "not associated";

  void SetUp() override {
    BusFixture::SetUp();
    if (IsSkipped()) return;
    if (const std::string obstacle = PlayedDaemon::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  }

  BusConnection connection{host, host.systemBus, "system bus"};
  // Daemons that are played answer late when the machine has much to do.
  BusNetworkStatus patient{host, connection, {std::chrono::seconds(5), std::chrono::seconds(9)}};
  BusNetworkStatus prompt{host, connection};
  BusNetworkStatus* status = &patient;
  Lines samples;  // answered, in order

  void startSample() {
    status->sampleWifi([this](const std::optional<WifiSignal>& signal) { samples.push_back(text(signal)); });
  }
  /// One sample to its end.
  std::string sample() {
    const std::size_t before = samples.size();
    startSample();
    EXPECT_TRUE(runUntil([&] { return samples.size() > before; }));
    EXPECT_EQ(samples.size(), before + 1);
    return samples.back();
  }

  /// Samples until the answer is that one: a daemon that went on a moment ago may be late.
  void sampleUntil(const std::string& wanted) {
    const SteadyTime deadline = clock.steadyNow() + std::chrono::minutes(3);
    while (sample() != wanted && clock.steadyNow() < deadline) {
    }
    EXPECT_EQ(samples.back(), wanted);
  }

  static std::string text(const std::optional<WifiSignal>& signal) {
    if (!signal) return kNothing;
    if (!signal->isAssociated) return kNotAssociated;
    const auto part = [](const std::optional<Number>& number) { return number ? numberText(*number) : "-"; };
    return "rssi " + part(signal->scaledRssi) + ", strength " + part(signal->signalStrength) + ", rate " +
           part(signal->scaledRate);
  }

  struct Device {
    std::string interface;
    std::string accessPoint = "/";  // below ours
    std::string bitRate = "uint32 54000";
    std::string type = "uint32 2";
  };
  static std::string devicePath(const Device& device) { return "/devices/" + device.interface; }
  /// NetworkManager's answers for these devices.
  static Answers managerOf(const std::vector<Device>& devices) {
    Answers answers;
    std::string list;
    for (const Device& device : devices) {
      list += (list.empty() ? "'" : ", '") + devicePath(device) + "'";
      answers.merge(
          playedProperties(devicePath(device), "org.freedesktop.NetworkManager.Device",
                           {{"DeviceType", device.type}, {"Interface", "'" + device.interface + "'"}}));
      answers.merge(playedProperties(
          devicePath(device), "org.freedesktop.NetworkManager.Device.Wireless",
          {{"ActiveAccessPoint", "objectpath '" + device.accessPoint + "'"}, {"Bitrate", device.bitRate}}));
    }
    answers[kDevices] = "(@ao [" + list + "],)";
    return answers;
  }
  static constexpr const char* kDevices =
      "/org/freedesktop/NetworkManager org.freedesktop.NetworkManager.GetDevices";
  static std::string strengthOf(const std::string& accessPoint) {
    return accessPoint +
           R"( org.freedesktop.DBus.Properties.Get("org.freedesktop.NetworkManager.AccessPoint", "Strength"))";
  }
  /// NetworkManager with one associated device wlan0 of 73 percent.
  static Answers associated() {
    Answers answers = managerOf({{.interface = "wlan0", .accessPoint = "/ap"}});
    answers[strengthOf("/ap")] = "(<byte 0x49>,)";
    return answers;
  }

  static constexpr const char* kPoll = "/supplicant/0 fi.w1.wpa_supplicant1.Interface.SignalPoll";
  static std::string supplicantProperty(const std::string& path, const std::string& interface,
                                        const std::string& name) {
    return path + R"( org.freedesktop.DBus.Properties.Get("fi.w1.wpa_supplicant1.)" + interface + R"(", ")" +
           name + R"("))";
  }
  /// wpa_supplicant with an associated interface wlan0.
  static Answers supplicant() {
    return {{R"(/fi/w1/wpa_supplicant1 fi.w1.wpa_supplicant1.GetInterface("wlan0"))",
             "(objectpath '/supplicant/0',)"},
            {supplicantProperty("/supplicant/0", "Interface", "State"), "(<'completed'>,)"},
            {supplicantProperty("/supplicant/0", "Interface", "CurrentBSS"), "(<objectpath '/bss'>,)"},
            {supplicantProperty("/bss", "BSS", "Signal"), "(<int16 -66>,)"},
            {kPoll, "(<{'rssi': <-58>, 'linkspeed': <144>, 'noise': <-95>, 'frequency': <uint32 5180>}>,)"}};
  }
};

}  // namespace zal::testing
