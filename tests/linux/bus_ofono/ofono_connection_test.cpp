#include "platform/linux/bus/telephony/ofono_connection.h"

#include <filesystem>

#include "tests/linux/bus_ofono/ofono_fixture.h"

namespace zal::testing {
namespace {

class OfonoConnectionTest : public OfonoFixture {
 protected:
  std::string state() { return cellularState(telephony, log); }
  /// One line of it, without its end.
  std::string row(const std::string& key) {
    const std::string all = "\n" + state();
    const std::size_t start = all.find("\n" + key + ": ");
    if (start == std::string::npos) return key + " is absent";
    return all.substr(start + 1, all.find('\n', start + 1) - start - 1);
  }
  /// The rows of a daemon that answers nothing.
  static std::string allFailed();
};

constexpr const char* kAllKeys[] = {"active-supported-bands",
                                    "allowed-mode",
                                    "bootloader-version",
                                    "cell-id",
                                    "data-attached",
                                    "data-disallowed",
                                    "data-enabled",
                                    "firmware-baseline-version",
                                    "firmware-version",
                                    "graded",
                                    "home-country",
                                    "international-data-enabled",
                                    "mobile-identity",
                                    "network-mcc",
                                    "network-mnc",
                                    "numeric-network-code-mode",
                                    "operator-name",
                                    "packet-context-count",
                                    "percentage",
                                    "provider-name",
                                    "radio-rat",
                                    "rat-preferred",
                                    "rat-selection",
                                    "registration-status",
                                    "reset-state",
                                    "rssi",
                                    "service-center-address",
                                    "sim-identity",
                                    "sim-mcc",
                                    "sim-mnc",
                                    "sim-status",
                                    "subscriber-country-code",
                                    "subscriber-identity",
                                    "tty-mode"};

std::string OfonoConnectionTest::allFailed() {
  std::string lines;
  for (const char* key : kAllKeys) lines += std::string(key) + ": FAILED\n";
  return lines;
}

TEST_F(OfonoConnectionTest, WithoutTheDaemonThereIsNoConnectionAndAWarning) {
  EXPECT_EQ(state(), "");
  EXPECT_EQ(log.lines, std::vector<std::string>{
                           "warning: CT Network information query failed, could not connect to Telvane"});
}

TEST_F(OfonoConnectionTest, WithoutABusThereIsNoConnection) {
  bus.kill();
  EXPECT_EQ(telephony.connect(), nullptr);
}

TEST_F(OfonoConnectionTest, AModemWithFewInterfacesFailsTheRowsOfTheOthersOnly) {
  startOfono();
  EXPECT_EQ(state(), R"(active-supported-bands: FAILED
allowed-mode: FAILED
bootloader-version: FAILED
cell-id: 10203
data-attached: YES
data-disallowed: NO
data-enabled: YES
firmware-baseline-version: FAILED
firmware-version: 0815.42
graded: 3
home-country: NO
international-data-enabled: NO
mobile-identity: 12345678-1234-1234-1234-000000000000
network-mcc: 777
network-mnc: 11
numeric-network-code-mode: 77711
operator-name: fake.tel
packet-context-count: 0
percentage: 80
radio-rat: gsm
rat-preferred: FAILED
rat-selection: FAILED
registration-status: registered
reset-state: NO
rssi: -63
service-center-address: FAILED
sim-identity: 893581234000000000000
sim-mcc: 310
sim-mnc: 150
sim-status: none
subscriber-country-code: 310
subscriber-identity: 310150000000000
tty-mode: FAILED
)");
}

TEST_F(OfonoConnectionTest, AModemWithAllInterfacesAnswersAllThatOfonoKnows) {
  startOfono();
  answerWith("RadioSettings", "{'TechnologyPreference': 'lte', 'GsmBand': 'any', 'UmtsBand': '1900'}");
  answerWith("MessageManager", "{'ServiceCenterAddress': '+15550001'}");
  answerWith("TextTelephony", "{'Enabled': True}");
  change("ConnectionManager", "Suspended=True, Attached=False, Powered=False, RoamingAllowed=True");
  change("SimManager", "ServiceProviderName='Home Net', MobileCountryCode='777'");
  tell("/ril_0",
       {"org.freedesktop.DBus.Mock", "AddMethod", "sssss", "org.ofono.ConnectionManager", "GetContexts", "",
        "a(oa{sv})", "ret = [('/ril_0/c1', {'Active': True}), ('/ril_0/c2', {})]"});
  EXPECT_EQ(state(), R"(active-supported-bands: { GsmBand=any UmtsBand=1900 }
allowed-mode: lte
bootloader-version: FAILED
cell-id: 10203
data-attached: NO
data-disallowed: YES
data-enabled: NO
firmware-baseline-version: FAILED
firmware-version: 0815.42
graded: 3
home-country: YES
international-data-enabled: YES
mobile-identity: 12345678-1234-1234-1234-000000000000
network-mcc: 777
network-mnc: 11
numeric-network-code-mode: 77711
operator-name: fake.tel
packet-context-count: 2
percentage: 80
provider-name: Home Net
radio-rat: gsm
rat-preferred: lte
rat-selection: lte
registration-status: registered
reset-state: NO
rssi: -63
service-center-address: +15550001
sim-identity: 893581234000000000000
sim-mcc: 777
sim-mnc: 150
sim-status: none
subscriber-country-code: 777
subscriber-identity: 310150000000000
tty-mode: YES
)");
}

TEST_F(OfonoConnectionTest, WithoutACardItsKeysAreAbsentAndLaterRowsAreStillThere) {
  startOfono();
  answerWith("SimManager", "{'Present': False}");
  EXPECT_EQ(row("sim-identity"), "sim-identity is absent");
  EXPECT_EQ(row("subscriber-identity"), "subscriber-identity is absent");
  EXPECT_EQ(row("sim-status"), "sim-status: sim-missing");
  EXPECT_EQ(row("sim-mcc"), "sim-mcc is absent");
  EXPECT_EQ(row("home-country"), "home-country: FAILED");
  EXPECT_EQ(row("network-mnc"), "network-mnc: 11");
}

TEST_F(OfonoConnectionTest, AnAnswerThatSaysNoIsNo) {
  startOfono();
  answerWith("TextTelephony", "{'Enabled': False}");
  EXPECT_EQ(row("tty-mode"), "tty-mode: NO");
}

TEST_F(OfonoConnectionTest, WrongTypesFailTheirOwnRows) {
  startOfono();
  change("NetworkRegistration", "Strength='strong', Name=dbus.UInt32(7), CellId=dbus.Byte(1)");
  change("ConnectionManager", "Attached='yes'");
  EXPECT_EQ(row("rssi"), "rssi: FAILED");
  EXPECT_EQ(row("percentage"), "percentage: FAILED");
  EXPECT_EQ(row("graded"), "graded: FAILED");
  EXPECT_EQ(row("operator-name"), "operator-name: FAILED");
  EXPECT_EQ(row("cell-id"), "cell-id: FAILED");
  EXPECT_EQ(row("data-attached"), "data-attached: FAILED");
  EXPECT_EQ(row("registration-status"), "registration-status: registered");
  EXPECT_EQ(row("data-enabled"), "data-enabled: YES");
}

TEST_F(OfonoConnectionTest, AnAnswerOfAnotherShapeFailsTheRowsOfItsInterface) {
  startOfono();
  answerWith("NetworkRegistration", "['registered', 'home']", "as");
  EXPECT_EQ(row("registration-status"), "registration-status: FAILED");
  EXPECT_EQ(row("rssi"), "rssi: FAILED");
  EXPECT_EQ(row("sim-status"), "sim-status: none");
}

TEST_F(OfonoConnectionTest, ADaemonWithoutAModemFailsEveryRow) {
  startOfono(false);
  EXPECT_EQ(state(), allFailed());
}

TEST_F(OfonoConnectionTest, OfSeveralModemsTheOneThatIsOnlineIsAsked) {
  startOfono();
  tell("/", {"org.freedesktop.DBus.Mock", "AddModem", "sa{sv}", "ril_1", "0"});
  EXPECT_EQ(row("mobile-identity"), "mobile-identity: 12345678-1234-1234-1234-000000000000");
  tell("/ril_0", {"org.ofono.Modem", "SetProperty", "sv", "Online", "b", "false"});
  EXPECT_EQ(row("mobile-identity"), "mobile-identity: 12345678-1234-1234-1234-000000000001");
  tell("/ril_1", {"org.ofono.Modem", "SetProperty", "sv", "Powered", "b", "false"});
  EXPECT_EQ(row("mobile-identity"), "mobile-identity: 12345678-1234-1234-1234-000000000000");
  EXPECT_EQ(row("reset-state"), "reset-state: YES");
}

TEST_F(OfonoConnectionTest, ADaemonThatHangsCostsOneTimeOutAndFailsTheRest) {
  startOfono();
  const auto connection = telephony.connect();
  ASSERT_NE(connection, nullptr);
  ASSERT_TRUE(connection->signalStrength());
  ofono->hang();
  // One question each to four interfaces that were not asked yet.
  for (const CellularQuery query :
       {CellularQuery::simStatus, CellularQuery::allowedMode, CellularQuery::serviceCenterAddress,
        CellularQuery::isDataAttached, CellularQuery::packetContextCount}) {
    EXPECT_FALSE(connection->query(query));
  }
  // What it said before stays.
  EXPECT_TRUE(connection->query(CellularQuery::operatorName));
  ofono->goOn();
}

TEST_F(OfonoConnectionTest, AModemThatIsSlowForOneInterfaceFailsItsRowsOnly) {
  ofono = std::make_unique<MockedService>(
      bus, "org.ofono", std::vector<std::string>{ZAL_TEST_SOURCE_DIRECTORY "/slow_modem_ofono.py"});
  EXPECT_EQ(row("allowed-mode"), "allowed-mode: FAILED");
  // Asked later than that one.
  EXPECT_TRUE(
      eventually([this] { return row("service-center-address") == "service-center-address: +15550001"; }));
}

TEST_F(OfonoConnectionTest, ADaemonThatHangsFromTheStartFailsEveryRow) {
  startOfono();
  ofono->hang();
  EXPECT_EQ(state(), allFailed());
  ofono->goOn();
  EXPECT_EQ(row("percentage"), "percentage: 80");
}

TEST_F(OfonoConnectionTest, ADaemonThatDiesFailsWhatWasNotAskedAndIsFoundAgain) {
  startOfono();
  const auto connection = telephony.connect();
  ASSERT_NE(connection, nullptr);
  ASSERT_TRUE(connection->signalStrength());
  ofono->kill();
  EXPECT_FALSE(connection->query(CellularQuery::simStatus));
  EXPECT_TRUE(eventually([&] { return telephony.connect() == nullptr; }));
  startOfono();
  EXPECT_FALSE(connection->query(CellularQuery::simIdentity));
  EXPECT_EQ(row("sim-status"), "sim-status: none");
}

TEST_F(OfonoConnectionTest, ABusThatDiesFailsTheRest) {
  startOfono();
  const auto connection = telephony.connect();
  ASSERT_NE(connection, nullptr);
  bus.kill();
  EXPECT_FALSE(connection->signalStrength());
  EXPECT_FALSE(connection->query(CellularQuery::simStatus));
}

TEST_F(OfonoConnectionTest, TheBasebandDumpIsTheHostsWithItsReason) {
  startOfono();
  FakePropertyListWriter unused;
  CellularSnapshot(telephony, unused, log).DumpBasebandState(std::nullopt, "Vistel/Quillet");
  EXPECT_EQ(telephony.basebandDumps, std::vector<std::string>{"Baseband dump for Vistel/Quillet logging"});
}

TEST_F(OfonoConnectionTest, ADaemonThatMayBeStartedIsNotStartedByAQuestion) {
  const std::string started = bus.servicesDirectory() + "/started";
  writeFile(bus.servicesDirectory() + "/org.ofono.service",
            "[D-BUS Service]\nName=org.ofono\nUser=root\nExec=/usr/bin/touch " + started + "\n");
  bus.kill();
  bus.start();
  EXPECT_EQ(telephony.connect(), nullptr);
  EXPECT_FALSE(bus.hasOwner("org.ofono"));
  EXPECT_FALSE(std::filesystem::exists(started));
  // It is the question that matters: a call does start it.
  (void)bus.busctl({"call", "--timeout=2", "org.ofono", "/", "org.ofono.Manager", "GetModems"});
  EXPECT_TRUE(eventually([&] { return std::filesystem::exists(started); }));
}

}  // namespace
}  // namespace zal::testing
