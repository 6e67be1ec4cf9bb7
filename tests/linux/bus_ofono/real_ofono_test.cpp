#include <unistd.h>

#include <filesystem>
#include <optional>

#include "tests/linux/bus_ofono/ofono_fixture.h"

namespace zal::testing {
namespace {

constexpr const char* kDaemon = "/usr/sbin/ofonod";
constexpr const char* kPython = "/usr/bin/python3";

/// The real daemon with its simulator driver, whose modem is the emulator of AT commands.
class RealOfonoTest : public BusFixture {
 protected:
  void SetUp() override {
    BusFixture::SetUp();
    if (IsSkipped()) return;
    if (!std::filesystem::exists(kDaemon)) GTEST_SKIP() << "ofono is not installed";
    // It keeps settings in /var/lib/ofono: the test gives it one of its own.
    if (::geteuid() != 0) GTEST_SKIP() << "a mount namespace for ofonod needs the superuser";
  }

  void startModem(std::vector<std::string> settings = {}) {
    settings.insert(settings.begin(), {kPython, ZAL_AT_EMULATOR, "--tcp", "0", "--control", control});
    emulator.emplace(ChildProgram::Options{.command = std::move(settings), .output = directory / "port"});
    ASSERT_TRUE(eventually([this] { return readFile(directory / "port").ends_with('\n'); }));
    const std::string ready = readFile(directory / "port");
    writeFile(directory / "phonesim.conf",
              "[phonesim]\nAddress=127.0.0.1\nPort=" + ready.substr(ready.find(' ') + 1));
  }
  /// Online it needs an unlocked card.
  void startDaemon(bool online = true) {
    const std::string output = directory / "ofonod.log";
    daemon.emplace(ChildProgram::Options{
        .command = {"/usr/bin/unshare", "--mount", "/bin/sh", "-c",
                    "mount -t tmpfs none /var/lib/ofono && exec /usr/sbin/ofonod -n --noplugin=udev,udevng"},
        .output = output,
        .errors = output,
        .environment = {{"OFONO_PHONESIM_CONFIG", directory / "phonesim.conf"},
                        {"DBUS_SYSTEM_BUS_ADDRESS", bus.address()}}});
    ASSERT_TRUE(eventually([this] { return bus.hasOwner("org.ofono"); })) << readFile(output);
    ASSERT_TRUE(set("Powered")) << readFile(output);
    if (!online) return;
    ASSERT_TRUE(set("Online")) << readFile(output);
  }
  bool set(const std::string& property, const std::string& value = "true") {
    return eventually([&] {
      return bus.busctl({"call", "org.ofono", "/phonesim", "org.ofono.Modem", "SetProperty", "sv", property,
                         "b", value}) == "";
    });
  }
  void tellModem(const std::vector<std::string>& settings) {
    std::vector<std::string> command = {kPython, ZAL_AT_EMULATOR, "--tell", control};
    command.insert(command.end(), settings.begin(), settings.end());
    EXPECT_EQ(outputOf(command), "");
  }
  std::string state() { return cellularState(telephony, log); }
  /// The listing once it is the one expected, else as it is in the end.
  std::string settledState(const std::string& expected) {
    (void)eventually([&] { return state() == expected; });
    return state();
  }

  TemporaryDirectory directory;
  const std::string control = directory / "control";
  OfonoOnly telephony{bus};
  std::optional<ChildProgram> emulator;
  std::optional<ChildProgram> daemon;
};

// One of the 34 keys is absent: the driver says nothing of bands.
TEST_F(RealOfonoTest, AllRowsOfARegisteredModemAreAccountedFor) {
  startModem();
  startDaemon();
  const std::string expected = R"(allowed-mode: any
bootloader-version: FAILED
cell-id: 10203
data-attached: NO
data-disallowed: NO
data-enabled: YES
firmware-baseline-version: FAILED
firmware-version: 1.2.3
graded: 3
home-country: YES
international-data-enabled: NO
mobile-identity: 490154203237518
network-mcc: 001
network-mnc: 01
numeric-network-code-mode: 00101
operator-name: Home Net
packet-context-count: 1
percentage: 64
provider-name: Home Net
radio-rat: lte
rat-preferred: any
rat-selection: any
registration-status: registered
reset-state: NO
rssi: -73
service-center-address: +15550001
sim-identity: 8949000000000000017
sim-mcc: 001
sim-mnc: 01
sim-status: none
subscriber-country-code: 001
subscriber-identity: 001010123456789
tty-mode: FAILED
)";
  EXPECT_EQ(settledState(expected), expected);
}

TEST_F(RealOfonoTest, AModemThatComesToAForeignNetworkIsSeenToRoam) {
  startModem();
  startDaemon();
  ASSERT_TRUE(eventually([this] { return state().find("operator-name: Home Net\n") != std::string::npos; }));
  tellModem({"csq=10", "registration=5", "network=20801", "operator=Far Net", "cell=00000007"});
  const auto roams = [this] {
    const std::string now = state();
    for (const char* row : {"registration-status: roaming", "cell-id: 7", "network-mcc: 208",
                            "home-country: NO", "percentage: 32", "graded: 2", "sim-mcc: 001"}) {
      if (now.find(std::string(row) + "\n") == std::string::npos) return false;
    }
    return true;
  };
  EXPECT_TRUE(eventually(roams)) << state();
}

// An ofonod 1.31 whose modem has no card at all crashes; the played one shows that case.
TEST_F(RealOfonoTest, WithALockedCardItsKeysAreAbsentAndTheInterfacesThatWaitForItFailTheirRows) {
  startModem({"sim=pin"});
  startDaemon(false);
  const std::string expected = R"(active-supported-bands: FAILED
allowed-mode: FAILED
bootloader-version: FAILED
cell-id: FAILED
data-attached: FAILED
data-disallowed: FAILED
data-enabled: FAILED
firmware-baseline-version: FAILED
firmware-version: 1.2.3
graded: FAILED
home-country: FAILED
international-data-enabled: FAILED
mobile-identity: 490154203237518
network-mcc: FAILED
network-mnc: FAILED
numeric-network-code-mode: FAILED
operator-name: FAILED
packet-context-count: FAILED
percentage: FAILED
radio-rat: FAILED
rat-preferred: FAILED
rat-selection: FAILED
registration-status: FAILED
reset-state: YES
rssi: FAILED
service-center-address: FAILED
sim-status: pin
tty-mode: FAILED
)";
  EXPECT_EQ(settledState(expected), expected);
}

}  // namespace
}  // namespace zal::testing
