#include "platform/linux/bus/telephony/bus_telephony.h"

#include <filesystem>
#include <future>
#include <set>

#include "tests/linux/bus_telephony/played_modem_manager.h"
#include "tests/linux/bus_telephony/telephony_fixture.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;
using Query = CellularQuery;

constexpr const char* kNobody =
    "warning: Without the cellular signal: Neither ModemManager nor oFono gives a signal strength";

class BusTelephonyTest : public TelephonyFixture {
 protected:
  /// Whoever starts ModemManager through the bus leaves this file.
  std::string startedMark() const { return directory.path() + "/started"; }
  void makeModemManagerStartable() {
    writeFile(bus.servicesDirectory() + "/modem.service",
              "[D-BUS Service]\nName=org.freedesktop.ModemManager1\nUser=root\nExec=/usr/bin/touch " +
                  startedMark() + "\n");
  }
  bool wasStarted() const { return std::filesystem::exists(startedMark()); }
};

TEST_F(BusTelephonyTest, WithTheTelephonyServiceStoppedTheSnapshotIsEmptyWithAWarning) {
  snapshot().WriteCellularState(directory.path());
  EXPECT_EQ(readFile(directory.path() + "/CTState.plist"),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n  <dict />\n</plist>\n");
  EXPECT_EQ(log.lines, Lines{"warning: CT Network information query failed, could not connect to Telvane"});
}

TEST_F(BusTelephonyTest, WithoutADaemonThereIsNoSignalAndItIsSaidOnce) {
  EXPECT_FALSE(sample());
  EXPECT_FALSE(sample());
  EXPECT_EQ(samples, 2);
  EXPECT_EQ(log.lines, Lines{kNobody});
}

TEST_F(BusTelephonyTest, WithoutABusNothingConnectsAndASampleStillAnswers) {
  bus.kill();
  EXPECT_EQ(telephony->connect(), nullptr);
  EXPECT_FALSE(sample());
}

TEST_F(BusTelephonyTest, AQuestionNeverStartsADaemon) {
  makeModemManagerStartable();
  EXPECT_EQ(telephony->connect(), nullptr);
  EXPECT_FALSE(sample());
  EXPECT_FALSE(wasStarted());
  // A call to the name would have.
  (void)bus.busctl(
      {"--expect-reply=no", "call", kModemManager, kModemManagerPath, "org.freedesktop.DBus.Peer", "Ping"});
  EXPECT_TRUE(eventually([this] { return wasStarted(); }));
}

TEST_F(BusTelephonyTest, ADaemonThatDiesBetweenTwoQuestionsIsNotStartedByTheSecond) {
  makeModemManagerStartable();
  auto manager = std::make_unique<PlayedModemManager>(bus);
  auto modem = manager->plainModem(0, 8, 80);
  modem->publish();
  const auto connection = telephony->connect();
  ASSERT_TRUE(connection->signalStrength());
  modem.reset();
  manager.reset();
  EXPECT_FALSE(connection->query(Query::serviceCenterAddress));
  EXPECT_FALSE(connection->query(Query::bootloaderVersion));
  EXPECT_FALSE(wasStarted());
  EXPECT_EQ(log.lines.size(), 1U);
}

TEST_F(BusTelephonyTest, OneQuestionIsOpenAtATime) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->publish();
  beginSample();
  beginSample();
  EXPECT_EQ(samples, 1);  // the second one, at once
  EXPECT_FALSE(lastSample);
  ASSERT_TRUE(runUntil([this] { return samples == 2; }));
  EXPECT_TRUE(lastSample);
  runFor(20ms);
  EXPECT_EQ(samples, 2);
}

TEST_F(BusTelephonyTest, ASampleMayBeBegunFromTheAnswerOfTheLast) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->publish();
  std::vector<bool> answers;
  telephony->sampleSignal([&](std::optional<CellularSignal> first) {
    answers.push_back(first.has_value());
    telephony->sampleSignal(
        [&](std::optional<CellularSignal> second) { answers.push_back(second.has_value()); });
  });
  ASSERT_TRUE(runUntil([&] { return answers.size() == 2; }));
  EXPECT_EQ(answers, (std::vector{true, true}));
}

TEST_F(BusTelephonyTest, AnOpenSampleEndsWithTheService) {
  PlayedModemManager manager(bus);
  ASSERT_FALSE(sample());
  beginSample();
  telephony.reset();
  runFor(50ms);
  EXPECT_EQ(samples, 1);
}

TEST_F(BusTelephonyTest, NothingIsOnTheBusBeforeTheFirstSample) {
  runFor(20ms);
  EXPECT_EQ(bus.busctl({"list", "--unique", "--no-legend", "--no-pager"}).find("linux_bus_tel"),
            std::string::npos);
}

TEST_F(BusTelephonyTest, AModemManagerWithoutAModemFailsEveryRow) {
  const PlayedModemManager manager(bus);
  const ValueMap state = snapshot().CopyCellularState();
  EXPECT_EQ(state.size(), 34U);
  for (const auto& [key, value] : state) EXPECT_EQ(value, Value("FAILED")) << key;
  EXPECT_FALSE(sample());
  EXPECT_EQ(log.lines, Lines{"warning: Without the cellular signal: ModemManager has no modem"});
}

TEST_F(BusTelephonyTest, OfSeveralModemsTheRegisteredOneIsAsked) {
  PlayedModemManager manager(bus);
  std::vector<PlayedModemManager::Modem> modems;
  modems.push_back(manager.plainModem(2, 8, 42));
  modems.push_back(manager.plainModem(0, 3, 0));
  modems.push_back(manager.plainModem(10, 8, 7));
  for (const auto& modem : modems) modem->publish();
  EXPECT_EQ(telephony->connect()->signalStrength()->percentage, 42);
  EXPECT_EQ(sample()->percentage, 42);
}

TEST_F(BusTelephonyTest, AMissingInterfaceFailsItsRowsAlone) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->has(kModem, "Revision", std::string("1.2.3"));
  modem->has(kModem, "EquipmentIdentifier", std::uint32_t{7});  // not of its type
  modem->publish();
  const ValueMap state = snapshot().CopyCellularState();
  std::set<std::string> answered;
  for (const auto& [key, value] : state) {
    if (value != Value("FAILED")) answered.insert(key);
  }
  EXPECT_EQ(answered,
            (std::set<std::string>{"rssi", "percentage", "graded", "firmware-version", "reset-state"}));
  EXPECT_EQ(state.size(), 34U);
}

TEST_F(BusTelephonyTest, NetworkManagerSaysWhetherDataAreEnabled) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->has(kModem3gpp, "RegistrationState", std::uint32_t{1});
  modem->publish();
  constexpr const char* kName = "org.freedesktop.NetworkManager";
  PlayedService networkManager(bus, kName, "/other");
  const auto root = networkManager.object("/org/freedesktop/NetworkManager");
  root->has(kName, "WwanEnabled", true).has(kName, "WwanHardwareEnabled", false);
  root->publish();
  EXPECT_EQ(answer(Query::isDataEnabled)->value, Value(true));
  EXPECT_EQ(answer(Query::isDataDisallowed)->value, Value(true));
}

TEST_F(BusTelephonyTest, WhatElseIsLocatedStaysSwitchedOn) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  std::atomic<std::uint32_t> sources = 0;
  std::atomic<bool> signals = false;
  modem->has(kModemLocation, "Enabled", std::uint32_t{2});
  modem->has(kModemLocation, "SignalsLocation", true);
  modem->answers(kModemLocation, "Setup", [&](const std::uint32_t& wanted, const bool& wantsSignals) {
    sources = wanted;
    signals = wantsSignals;
  });
  modem->answers(kModemLocation, "GetLocation", [] {
    return std::map<std::uint32_t, sdbus::Variant>{{1, sdbus::Variant(std::string("001,01,0,27DB,3DB"))}};
  });
  modem->publish();
  EXPECT_EQ(answer(Query::servingCellId)->value, Value(0x27DB));
  EXPECT_EQ(sources, 3U);
  EXPECT_TRUE(signals);
}

TEST_F(BusTelephonyTest, TheBootLoaderIsAskedOfTheFirmware) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  using Image = std::map<std::string, sdbus::Variant>;
  modem->answers(kModemFirmware, "List", [] {
    return std::tuple(std::string("a"),
                      std::vector<Image>{{{"unique-id", sdbus::Variant(std::string("a"))},
                                          {"gobi-boot-version", sdbus::Variant(std::string("boot 7"))}}});
  });
  modem->publish();
  EXPECT_EQ(answer(Query::bootloaderVersion)->value, Value("boot 7"));
}

TEST_F(BusTelephonyTest, AMethodThatNeverAnswersIsTheLastThatIsCalled) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  std::atomic<int> calls = 0;
  std::vector<sdbus::Result<std::string>> open;
  modem->answers(kModem, "Command",
                 [&](sdbus::Result<std::string>&& result, const std::string&, const std::uint32_t&) {
                   open.push_back(std::move(result));
                   ++calls;  // the last, so that who sees it sees the result as well
                 });
  modem->publish();
  const auto connection = telephony->connect();
  EXPECT_FALSE(connection->query(Query::serviceCenterAddress));
  EXPECT_FALSE(connection->query(Query::serviceCenterAddress));
  EXPECT_EQ(calls, 1);
  EXPECT_TRUE(connection->signalStrength());  // read before
}

TEST_F(BusTelephonyTest, ADaemonThatAnswersNonsenseFailsEveryRow) {
  if (const std::string obstacle = MockedService::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  const MockedService nonsense(
      bus, kModemManager,
      {"-m", "dbusmock", "--system", kModemManager, kModemManagerPath, "org.freedesktop.DBus.ObjectManager"});
  ASSERT_EQ(
      bus.busctl({"call", kModemManager, kModemManagerPath, "org.freedesktop.DBus.Mock", "AddMethod", "sssss",
                  "org.freedesktop.DBus.ObjectManager", "GetManagedObjects", "", "s", "ret = 'nonsense'"}),
      "");
  const ValueMap state = snapshot().CopyCellularState();
  EXPECT_EQ(state.size(), 34U);
  for (const auto& [key, value] : state) EXPECT_EQ(value, Value("FAILED")) << key;
  EXPECT_FALSE(sample());
}

TEST_F(BusTelephonyTest, ABusThatTakesConnectionsAndSaysNothingIsNoConnection) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->publish();
  bus.hang();
  auto connection = std::async(std::launch::async, [this] { return telephony->connect(); });
  // While it hangs; the bus library itself would wait for minutes.
  const bool isAnswered = connection.wait_for(30s) == std::future_status::ready;
  bus.goOn();
  EXPECT_TRUE(isAnswered);
  EXPECT_EQ(connection.get(), nullptr);
  EXPECT_NE(telephony->connect(), nullptr);
}

TEST_F(BusTelephonyTest, ABusThatHangsHoldsUpNeitherTheLoopNorTheSample) {
  PlayedModemManager manager(bus);
  const auto modem = manager.plainModem(0, 8, 80);
  modem->publish();
  ASSERT_TRUE(sample());
  bus.hang();
  EXPECT_EQ(strayWaitsDuring([&] { EXPECT_FALSE(sample()); }), 0U);
  bus.goOn();
  EXPECT_TRUE(signalComesBack());
  EXPECT_EQ(log.lines, (Lines{"warning: Without the cellular signal: The system bus does not answer",
                              "notice: The cellular signal is sampled again"}));
}

}  // namespace
}  // namespace zal::testing
