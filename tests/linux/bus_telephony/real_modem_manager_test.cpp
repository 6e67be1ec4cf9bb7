#include <algorithm>
#include <map>
#include <set>
#include <sstream>
#include <vector>

#include "platform/linux/bus/telephony/modem_state.h"
#include "tests/linux/bus_telephony/telephony_fixture.h"
#include "tests/support/emulated_modem.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

/// The real daemon takes seconds to come up: one for all cases, each of which says what it needs of it.
struct RealModem {
  PrivateBus bus;
  EmulatedModem modem;
  RealModemManager manager{bus, modem};
};

class RealModemManagerTest : public TelephonyFixture {
 protected:
  static void SetUpTestSuite() {
    if (PrivateBus::obstacle().empty() && RealModemManager::obstacle().empty()) {
      real = std::make_unique<RealModem>();
    }
  }
  static void TearDownTestSuite() { real.reset(); }

  void SetUp() override {
    TelephonyFixture::SetUp();
    if (IsSkipped()) return;
    if (real == nullptr) GTEST_SKIP() << RealModemManager::obstacle();
    real->manager.allow(true);
    real->modem.set({"csq=20", "registration=1"});
    ASSERT_TRUE(hasProperty("SignalQuality", "(ub) 80"));
    useBus(real->bus);
  }

  /// Waits until the modem's property is printed so.
  static bool hasProperty(const std::string& name, const std::string& text) {
    return eventually([&] { return real->manager.property(name).starts_with(text); });
  }
  /// The snapshot's file as another reader of property lists has it.
  std::string snapshotText() {
    const std::string path = directory.path() + "/CTState.plist";
    snapshot().WriteCellularState(directory.path());
    return outputOf(
        {"/usr/bin/python3", "-c",
         "import plistlib, sys\n"
         "for key, value in sorted(plistlib.load(open(sys.argv[1], 'rb')).items()): print(key, value)",
         path});
  }
  /// What mmcli prints as "key : value", without what it has no value for.
  static std::map<std::string, std::string> mmcli(const std::vector<std::string>& words) {
    std::map<std::string, std::string> values;
    std::istringstream lines(real->manager.mmcli(words));
    for (std::string line; std::getline(lines, line);) {
      const std::size_t colon = line.find(" : ");
      if (colon == std::string::npos || line.substr(colon + 3) == "--") continue;
      values[line.substr(0, line.find(' '))] = line.substr(colon + 3);
    }
    return values;
  }

  static std::unique_ptr<RealModem> real;
};

std::unique_ptr<RealModem> RealModemManagerTest::real;

/// Of the 34 rows firmware-baseline-version is the one that this modem has no value for.
constexpr const char* kSnapshot = R"(active-supported-bands {'active': [0], 'supported': [0]}
allowed-mode 2g|3g|4g
bootloader-version FAILED
cell-id 10203
data-attached YES
data-disallowed NO
data-enabled NO
firmware-version 1.2.3
graded 3
home-country YES
international-data-enabled FAILED
mobile-identity 490154203237518
network-mcc 001
network-mnc 01
numeric-network-code-mode 00101
operator-name Test Net
packet-context-count 0
percentage 80
provider-name Home Net
radio-rat lte
rat-preferred none
rat-selection 2g|3g|4g
registration-status home
reset-state NO
rssi -63
service-center-address +15550001
sim-identity 8949000000000000017
sim-mcc 001
sim-mnc 01
sim-status none
subscriber-country-code 001
subscriber-identity 001010123456789
tty-mode FAILED)";

TEST_F(RealModemManagerTest, EveryRowOfTheSnapshotIsAccountedFor) { EXPECT_EQ(snapshotText(), kSnapshot); }

TEST_F(RealModemManagerTest, TheSnapshotSaysWhatMmcliSays) {
  const std::map<std::string, std::string> keyOf{
      {"percentage", "modem.generic.signal-quality.value"},
      {"operator-name", "modem.3gpp.operator-name"},
      {"provider-name", "sim.properties.operator-name"},
      {"numeric-network-code-mode", "modem.3gpp.operator-code"},
      {"firmware-version", "modem.generic.revision"},
      {"mobile-identity", "modem.generic.equipment-identifier"},
      {"sim-identity", "sim.properties.iccid"},
      {"subscriber-identity", "sim.properties.imsi"},
      {"registration-status", "modem.3gpp.registration-state"},
      {"radio-rat", "modem.generic.access-technologies.value[1]"},
  };
  const ValueMap state = snapshot().CopyCellularState();
  auto said = mmcli({"-m", "any", "-K"});
  said.merge(mmcli({"-i", "0", "-K"}));
  for (const auto& [key, mmcliKey] : keyOf) {
    const Value& value = state.at(key);
    const auto* const number = value.as<std::int64_t>();
    EXPECT_EQ(number != nullptr ? std::to_string(*number) : *value.as<std::string>(), said[mmcliKey]) << key;
  }
  EXPECT_EQ(state.at("data-attached"), Value("YES"));
  EXPECT_EQ(said["modem.3gpp.packet-service-state"], "attached");
  EXPECT_EQ(state.at("allowed-mode"), Value("2g|3g|4g"));
  EXPECT_EQ(said["modem.generic.current-modes"], "allowed: 2g, 3g, 4g; preferred: none");
  EXPECT_EQ(said.count("modem.generic.carrier-configuration-revision"), 0U);
  EXPECT_EQ(state.count("firmware-baseline-version"), 0U);
  EXPECT_EQ(state.at("cell-id"), Value(0x27DB));
  EXPECT_EQ(mmcli({"-m", "any", "--location-get", "-K"})["modem.location.3gpp.cid"], "000027DB");
}

TEST_F(RealModemManagerTest, ASignalThatChangesShowsInTheNextSample) {
  const auto before = sample();
  ASSERT_TRUE(before);
  EXPECT_EQ((std::vector{before->rssi, before->percentage, before->graded}), (std::vector{-63, 80, 3}));
  real->modem.set({"csq=8"});
  ASSERT_TRUE(hasProperty("SignalQuality", "(ub) 40"));
  const auto after = sample();
  ASSERT_TRUE(after);
  EXPECT_EQ((std::vector{after->rssi, after->percentage, after->graded}), (std::vector{-89, 40, 2}));
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(RealModemManagerTest, RoamingShowsInTheSnapshot) {
  real->modem.set({"registration=5"});
  ASSERT_TRUE(
      eventually([&] { return answer(CellularQuery::registrationStatus)->value == Value("roaming"); }));
}

TEST_F(RealModemManagerTest, ABearerBringsItsRows) {
  const std::string bearer = real->manager.call(
      kModem, "CreateBearer", {"a{sv}", "2", "apn", "s", "internet", "allow-roaming", "b", "false"});
  ASSERT_TRUE(bearer.starts_with("o \"")) << bearer;
  const ValueMap state = snapshot().CopyCellularState();
  EXPECT_EQ(state.at("packet-context-count"), Value(1));
  EXPECT_EQ(state.at("international-data-enabled"), Value("NO"));
  EXPECT_EQ(state.at("data-enabled"), Value("NO"));
  const std::string path = bearer.substr(3, bearer.size() - 4);
  EXPECT_EQ(real->manager.call(kModem, "DeleteBearer", {"o", path}), "");
}

TEST_F(RealModemManagerTest, WhatPolkitRefusesFailsAlone) {
  const ValueMap allowed = snapshot().CopyCellularState();
  real->manager.allow(false);
  const ValueMap refused = snapshot().CopyCellularState();
  std::set<std::string> failed;
  for (const auto& [key, value] : refused) {
    if (value == allowed.at(key)) continue;
    EXPECT_EQ(value, Value("FAILED")) << key;
    failed.insert(key);
  }
  EXPECT_EQ(failed, (std::set<std::string>{"cell-id", "service-center-address"}));
  EXPECT_EQ(refused.size(), allowed.size());
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(RealModemManagerTest, ADaemonThatHangsIsSkippedWithoutHoldingUpTheLoop) {
  ASSERT_TRUE(sample());
  real->manager.hang();
  EXPECT_EQ(strayWaitsDuring([&] { EXPECT_FALSE(sample()); }), 0U);
  real->manager.goOn();
  EXPECT_TRUE(signalComesBack());
  EXPECT_EQ(log.lines, (Lines{"warning: Without the cellular signal: ModemManager does not answer",
                              "notice: The cellular signal is sampled again"}));
}

TEST_F(RealModemManagerTest, ADaemonThatHangsCostsASnapshotOneTimeOut) {
  real->manager.hang();
  const ValueMap state = snapshot().CopyCellularState();
  real->manager.goOn();
  EXPECT_EQ(state.size(), 34U);
  for (const auto& [key, value] : state) EXPECT_EQ(value, Value("FAILED")) << key;
  ASSERT_EQ(log.lines.size(), 1U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: ModemManager does not answer: ")) << log.lines[0];
}

TEST_F(RealModemManagerTest, ADaemonThatDiesAndComesBackIsSampledAgain) {
  ASSERT_TRUE(sample());
  const auto connection = telephony->connect();
  ASSERT_TRUE(connection->query(CellularQuery::operatorName));
  real->manager.kill();
  ASSERT_TRUE(eventually([&] { return telephony->connect() == nullptr; }));
  EXPECT_TRUE(connection->query(CellularQuery::mobileIdentity));  // read before
  EXPECT_FALSE(connection->query(CellularQuery::servingCellId));
  EXPECT_FALSE(connection->query(CellularQuery::serviceCenterAddress));
  EXPECT_FALSE(sample());
  EXPECT_FALSE(sample());
  real->manager.start();
  EXPECT_TRUE(signalComesBack());
  ASSERT_EQ(log.lines.size(), 3U);
  EXPECT_TRUE(log.lines[0].starts_with("warning: ModemManager does not answer: ")) << log.lines[0];
  EXPECT_EQ(log.lines[1],
            "warning: Without the cellular signal: Neither ModemManager nor oFono gives a signal strength");
  EXPECT_EQ(log.lines[2], "notice: The cellular signal is sampled again");
}

TEST_F(RealModemManagerTest, ABusThatIsRestartedIsPickedUpAgain) {
  ASSERT_TRUE(sample());
  const auto connection = telephony->connect();
  real->manager.kill();
  real->bus.kill();
  EXPECT_FALSE(sample());
  EXPECT_FALSE(sample());
  EXPECT_EQ(telephony->connect(), nullptr);
  EXPECT_FALSE(connection->query(CellularQuery::operatorName));
  real->bus.start();
  real->manager.startAgain();
  EXPECT_TRUE(signalComesBack());
  EXPECT_TRUE(answer(CellularQuery::operatorName));
  const std::string said = "warning: Without the cellular signal: The system bus does not answer";
  EXPECT_EQ(std::count(log.lines.begin(), log.lines.end(), said), 1);
}

TEST_F(RealModemManagerTest, ABasebandDumpIsHandedToItsStarter) {
  EXPECT_TRUE(snapshot().DumpBasebandState(std::nullopt, "Vistel/Quillet"));
  EXPECT_EQ(dumped, "Baseband dump for Vistel/Quillet logging");
}

/// The identities are of a card that is not there; what comes after them is of the modem.
TEST_F(RealModemManagerTest, ADeviceWithoutASimKeepsTheLaterRows) {
  const PrivateBus otherBus;
  const EmulatedModem modem({"sim=none"});
  const RealModemManager manager(otherBus, modem, -1);
  useBus(otherBus);
  const ValueMap state = snapshot().CopyCellularState();
  for (const char* key : {"provider-name", "sim-identity", "subscriber-identity", "subscriber-country-code",
                          "sim-mcc", "sim-mnc"}) {
    EXPECT_EQ(state.count(key), 0U) << key;
  }
  EXPECT_EQ(state.at("sim-status"), Value("sim-missing"));
  EXPECT_EQ(state.at("home-country"), Value("FAILED"));
  EXPECT_EQ(state.at("mobile-identity"), Value("490154203237518"));
  EXPECT_EQ(state.at("reset-state"), Value("YES"));
  EXPECT_EQ(state.at("packet-context-count"), Value(0));
}

}  // namespace
}  // namespace zal::testing
