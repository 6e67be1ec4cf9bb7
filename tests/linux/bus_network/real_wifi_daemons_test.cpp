#include <filesystem>

#include "tests/linux/bus_network/wifi_fixture.h"

namespace zal::testing {
namespace {

constexpr const char* kDevicePath = "/org/freedesktop/NetworkManager/Devices/wlan0";
constexpr const char* kWireless = "org.freedesktop.NetworkManager.Device.Wireless";

/// NetworkManager as other projects' tests play it.
class MockedNetworkManagerTest : public WifiFixture {
 protected:
  std::unique_ptr<MockedService> manager;

  void SetUp() override {
    WifiFixture::SetUp();
    if (IsSkipped()) return;
    if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
    manager = std::make_unique<MockedService>(bus, kManager,
                                              Lines{"-m", "dbusmock", "--system", "-t", "networkmanager"});
    mock("/org/freedesktop/NetworkManager", "AddWiFiDevice", {"ssi", "wlan0", "wlan0", "100"});
    mock("/org/freedesktop/NetworkManager", "AddAccessPoint",
         {"ssssuuuyu", kDevicePath, "ap0", "Test Net", "00:23:f8:7e:12:bb", "2", "5180", "866700", "73",
          "1024"});
  }
  void mock(const std::string& path, const std::string& method, const Lines& arguments) {
    Lines words{"call", kManager, path, "org.freedesktop.DBus.Mock", method};
    words.insert(words.end(), arguments.begin(), arguments.end());
    const std::string printed = bus.busctl(words);
    EXPECT_EQ(printed.find("failed"), std::string::npos) << printed;
  }
  void setAccessPoint(const std::string& path) {
    mock(kDevicePath, "AddProperty", {"ssv", kWireless, "ActiveAccessPoint", "o", path});
  }
  void setStrength(const std::string& percent) {
    mock("/org/freedesktop/NetworkManager/AccessPoint/ap0", "UpdateProperties",
         {"sa{sv}", "org.freedesktop.NetworkManager.AccessPoint", "1", "Strength", "y", percent});
  }
};

TEST_F(MockedNetworkManagerTest, AStrengthThatChangesIsSeenAtTheNextSample) {
  // The mock itself knows no such property: a device that never had an association.
  EXPECT_EQ(sample(), kNotAssociated);
  setAccessPoint("/org/freedesktop/NetworkManager/AccessPoint/ap0");
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 5.4");
  setStrength("40");
  EXPECT_EQ(sample(), "rssi -76, strength 40, rate 5.4");
  setStrength("41");
  EXPECT_EQ(sample(), "rssi -75, strength 41, rate 5.4");
}

TEST_F(MockedNetworkManagerTest, AnAccessPointOfNoneIsNotAssociated) {
  setAccessPoint("/");
  EXPECT_EQ(sample(), kNotAssociated);
}

/// The real program, which here has no radio, in a network namespace of its own.
class RealSupplicantTest : public WifiFixture {
 protected:
  std::unique_ptr<ChildProgram> program;

  void SetUp() override {
    WifiFixture::SetUp();
    if (IsSkipped()) return;
    constexpr const char* kProgram = "/usr/sbin/wpa_supplicant";
    if (!std::filesystem::exists(kProgram)) GTEST_SKIP() << "wpasupplicant is not installed";
    if (!outputOf({"unshare", "-n", "true"}).empty()) GTEST_SKIP() << "no network namespace may be made here";
    program = std::make_unique<ChildProgram>(
        ChildProgram::Options{.command = {"/usr/bin/unshare", "-n", kProgram, "-u"},
                              .environment = {{"DBUS_SYSTEM_BUS_ADDRESS", bus.address()}}});
    ASSERT_TRUE(eventually([this] { return bus.hasOwner(kSupplicant); }));
  }
  /// Gives it the loopback interface, as a wire that needs no radio.
  [[nodiscard]] bool addInterface() const {
    return bus
        .busctl({"call", kSupplicant, "/fi/w1/wpa_supplicant1", kSupplicant, "CreateInterface", "a{sv}", "2",
                 "Ifname", "s", "lo", "Driver", "s", "wired"})
        .starts_with("o ");
  }
};

TEST_F(RealSupplicantTest, WithoutTheInterfaceTheRssiFollowsFromTheStrength) {
  const PlayedDaemon manager(bus, kManager, associated());
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(RealSupplicantTest, APollThatFailsWithoutARadioLeavesTheRssiToTheStrength) {
  if (!addInterface()) GTEST_SKIP() << "wpa_supplicant takes no wired interface here";
  Answers answers = managerOf({{.interface = "lo", .accessPoint = "/ap"}});
  answers[strengthOf("/ap")] = "(<byte 0x49>,)";
  const PlayedDaemon manager(bus, kManager, answers);
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(RealSupplicantTest, AloneItIsNotAssociated) {
  EXPECT_EQ(sample(), kNotAssociated);
  if (!addInterface()) GTEST_SKIP() << "wpa_supplicant takes no wired interface here";
  configuration.interfaces.wifi = "lo";
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_EQ(log.lines, Lines{"notice: NetworkManager is not running"});
}

}  // namespace
}  // namespace zal::testing
