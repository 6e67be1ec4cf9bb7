#include "platform/linux/bus/network/bus_network_status.h"

#include <algorithm>

#include "tests/linux/bus_network/wifi_fixture.h"

namespace zal::testing {
namespace {

class BusNetworkStatusTest : public WifiFixture {
 protected:
  /// A file with which the bus could start the daemon; it would leave a mark.
  void makeStartable(const std::string& name) {
    writeFile(bus.servicesDirectory() + "/" + name + ".service",
              "[D-BUS Service]\nName=" + name + "\nExec=/usr/bin/touch " + mark() + "\n");
  }
  [[nodiscard]] std::string mark() const { return _directory / "started"; }

 private:
  TemporaryDirectory _directory;
};

TEST_F(BusNetworkStatusTest, WithoutADaemonNothingIsAssociatedAndTheLogSaysSoOnce) {
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_EQ(log.lines,
            (Lines{"notice: NetworkManager is not running", "notice: wpa_supplicant is not running"}));
}

TEST_F(BusNetworkStatusTest, WithoutABusNothingIsAssociatedAtOnce) {
  bus.kill();
  startSample();
  EXPECT_EQ(samples, Lines{kNotAssociated});
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(BusNetworkStatusTest, NoDaemonIsStartedByTheQuestion) {
  makeStartable(kManager);
  makeStartable(kSupplicant);
  ASSERT_TRUE(eventually([&] {
    const std::string known = bus.busctl({"list", "--activatable", "--no-legend", "--no-pager"});
    return known.find(kManager) != std::string::npos && known.find(kSupplicant) != std::string::npos;
  }));
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_FALSE(std::filesystem::exists(mark()));
}

TEST_F(BusNetworkStatusTest, TheManagerTellsStrengthAndRateAndTheSupplicantTheRssi) {
  const PlayedDaemon manager(bus, kManager, associated());
  const PlayedDaemon wpa(bus, kSupplicant, supplicant());
  EXPECT_EQ(sample(), "rssi -58, strength 73, rate 54");
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(BusNetworkStatusTest, APollThatIsAPlainDictionaryIsUnderstoodToo) {
  const PlayedDaemon manager(bus, kManager, associated());
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  wpa.answer(kPoll, "({'rssi': <-61>},)");
  EXPECT_EQ(sample(), "rssi -61, strength 73, rate 54");
}

TEST_F(BusNetworkStatusTest, WithoutTheSupplicantTheRssiFollowsFromTheStrength) {
  const PlayedDaemon manager(bus, kManager, associated());
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  EXPECT_EQ(log.lines, Lines{"notice: wpa_supplicant is not running"});
}

TEST_F(BusNetworkStatusTest, APollThatIsRefusedLeavesTheRssiToTheStrength) {
  const PlayedDaemon manager(bus, kManager, associated());
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  wpa.answer(kPoll, "!org.freedesktop.DBus.Error.Failed");
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  EXPECT_EQ(log.lines, Lines{});
}

TEST_F(BusNetworkStatusTest, AnInterfaceThatTheSupplicantDoesNotHaveLeavesTheRssiToTheStrength) {
  const PlayedDaemon manager(bus, kManager, associated());
  const PlayedDaemon wpa(bus, kSupplicant, {});
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
}

TEST_F(BusNetworkStatusTest, ARateThatTheManagerDoesNotKnowIsTheLinkSpeed) {
  Answers answers = associated();
  answers.merge(managerOf({}));
  answers
      ["/devices/wlan0 "
       "org.freedesktop.DBus.Properties.GetAll(\"org.freedesktop.NetworkManager.Device.Wireless\")"] =
          "({'ActiveAccessPoint': <objectpath '/ap'>, 'Bitrate': <uint32 0>},)";
  const PlayedDaemon manager(bus, kManager, answers);
  const PlayedDaemon wpa(bus, kSupplicant, supplicant());
  EXPECT_EQ(sample(), "rssi -58, strength 73, rate 144");
}

TEST_F(BusNetworkStatusTest, TheConfiguredInterfaceGoesBeforeOthers) {
  Answers answers = managerOf({{.interface = "eth0", .type = "uint32 1"},
                               {.interface = "wlan1", .accessPoint = "/other"},
                               {.interface = "wlan0", .accessPoint = "/ap"}});
  answers[strengthOf("/ap")] = "(<byte 0x49>,)";
  answers[strengthOf("/other")] = "(<byte 0x0a>,)";
  const PlayedDaemon manager(bus, kManager, answers);
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
}

TEST_F(BusNetworkStatusTest, WhileTheConfiguredInterfaceIsNotAssociatedTheFirstThatIsCounts) {
  Answers answers = managerOf({{.interface = "wlan0"},
                               {.interface = "wlan1"},
                               {.interface = "wlan2", .accessPoint = "/ap", .bitRate = "uint32 6500"},
                               {.interface = "wlan3", .accessPoint = "/other"}});
  answers[strengthOf("/ap")] = "(<byte 0x64>,)";
  const PlayedDaemon manager(bus, kManager, answers);
  EXPECT_EQ(sample(), "rssi -40, strength 100, rate 6.5");
}

TEST_F(BusNetworkStatusTest, WithoutAnAssociatedDeviceNothingIsAssociated) {
  PlayedDaemon manager(bus, kManager,
                       managerOf({{.interface = "wlan0"}, {.interface = "p2p0", .type = "uint32 30"}}));
  EXPECT_EQ(sample(), kNotAssociated);
  manager.answer(kDevices, "(@ao [],)");
  EXPECT_EQ(sample(), kNotAssociated);
}

TEST_F(BusNetworkStatusTest, AnAccessPointThatIsGoneMeanwhileLeavesItsStrengthOut) {
  const PlayedDaemon manager(bus, kManager, managerOf({{.interface = "wlan0", .accessPoint = "/ap"}}));
  EXPECT_EQ(sample(), "rssi -, strength -, rate 54");
}

TEST_F(BusNetworkStatusTest, TheSupplicantAloneTellsEverything) {
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  EXPECT_EQ(sample(), "rssi -58, strength 70, rate 144");
  wpa.answer(kPoll, "!org.freedesktop.DBus.Error.Failed");
  EXPECT_EQ(sample(), "rssi -66, strength 57, rate -");
  wpa.answer(supplicantProperty("/supplicant/0", "Interface", "State"), "(<'scanning'>,)");
  EXPECT_EQ(sample(), kNotAssociated);
  wpa.answer(supplicantProperty("/supplicant/0", "Interface", "State"), "(<'completed'>,)");
  wpa.answer(supplicantProperty("/supplicant/0", "Interface", "CurrentBSS"), "(<objectpath '/'>,)");
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_EQ(log.lines, Lines{"notice: NetworkManager is not running"});
}

TEST_F(BusNetworkStatusTest, TheSupplicantAloneWithoutTheInterfaceIsNotAssociated) {
  const PlayedDaemon wpa(bus, kSupplicant, {});
  EXPECT_EQ(sample(), kNotAssociated);
}

TEST_F(BusNetworkStatusTest, AManagerThatHangsIsLeftOutSaidOnceAndPickedUpAgain) {
  PlayedDaemon manager(bus, kManager, associated());
  const PlayedDaemon wpa(bus, kSupplicant, supplicant());
  EXPECT_EQ(sample(), "rssi -58, strength 73, rate 54");
  status = &prompt;
  manager.hang();
  EXPECT_EQ(sample(), kNothing);
  EXPECT_EQ(sample(), kNothing);
  manager.goOn();
  sampleUntil("rssi -58, strength 73, rate 54");
  EXPECT_EQ(log.lines,
            (Lines{"warning: NetworkManager does not answer", "notice: NetworkManager answers again"}));
}

TEST_F(BusNetworkStatusTest, AManagerThatDiesIsSaidOnceAndPickedUpAgain) {
  const PlayedDaemon wpa(bus, kSupplicant, {});
  {
    const PlayedDaemon manager(bus, kManager, associated());
    EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  }
  ASSERT_TRUE(eventually([this] { return !bus.hasOwner(kManager); }));
  EXPECT_EQ(sample(), kNotAssociated);
  EXPECT_EQ(sample(), kNotAssociated);
  const PlayedDaemon next(bus, kManager, associated());
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  EXPECT_EQ(log.lines,
            (Lines{"notice: NetworkManager is not running", "notice: NetworkManager answers again"}));
}

TEST_F(BusNetworkStatusTest, AManagerThatDiesWhileItIsAskedGivesNothing) {
  Answers answers = associated();
  answers[kDevices] = "?";
  PlayedDaemon manager(bus, kManager, answers);
  startSample();
  ASSERT_TRUE(runUntil([&] { return !manager.calls().empty(); }));
  manager.kill();
  ASSERT_TRUE(runUntil([this] { return !samples.empty(); }));
  EXPECT_EQ(samples, Lines{kNothing});
}

TEST_F(BusNetworkStatusTest, AManagerThatIsSilentInTheMiddleGivesNothing) {
  PlayedDaemon manager(bus, kManager, associated());
  status = &prompt;
  manager.answer(strengthOf("/ap"), "?");
  EXPECT_EQ(sample(), kNothing);
  EXPECT_EQ(sample(), kNothing);
  EXPECT_EQ(log.lines,
            (Lines{"warning: NetworkManager does not answer", "notice: wpa_supplicant is not running"}));
}

TEST_F(BusNetworkStatusTest, ASupplicantThatHangsLeavesTheRssiToTheStrengthAndIsSaidOnce) {
  const PlayedDaemon manager(bus, kManager, associated());
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  status = &prompt;
  wpa.hang();
  sampleUntil("rssi -56, strength 73, rate 54");
  sampleUntil("rssi -56, strength 73, rate 54");
  wpa.goOn();
  sampleUntil("rssi -58, strength 73, rate 54");
  EXPECT_EQ(log.lines,
            (Lines{"warning: wpa_supplicant does not answer", "notice: wpa_supplicant answers again"}));
}

TEST_F(BusNetworkStatusTest, ASupplicantThatHangsAloneGivesNothing) {
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  status = &prompt;
  wpa.hang();
  EXPECT_EQ(sample(), kNothing);
  wpa.goOn();
  sampleUntil("rssi -58, strength 70, rate 144");
}

TEST_F(BusNetworkStatusTest, ValuesOfAnotherTypeAreLeftOutAndSaidOnce) {
  PlayedDaemon manager(bus, kManager, associated());
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  manager.answer(strengthOf("/ap"), "(<'strong'>,)");
  wpa.answer(kPoll, "(<{'rssi': <'loud'>, 'linkspeed': <true>}>,)");
  EXPECT_EQ(sample(), "rssi -, strength -, rate 54");
  EXPECT_EQ(sample(), "rssi -, strength -, rate 54");
  manager.answer(strengthOf("/ap"), "(<byte 0x49>,)");
  wpa.answer(kPoll, "({'rssi': <-58>},)");
  EXPECT_EQ(sample(), "rssi -58, strength 73, rate 54");
  EXPECT_EQ(log.lines,
            (Lines{"warning: NetworkManager answers what cannot be read",
                   "warning: wpa_supplicant answers what cannot be read",
                   "notice: NetworkManager answers again", "notice: wpa_supplicant answers again"}));
}

TEST_F(BusNetworkStatusTest, AnswersOfAnotherTypeGiveNothingAtEveryStep) {
  struct Case {
    const char* what;
    std::string call;
    std::string answer;
  };
  const std::string properties = "/devices/wlan0 org.freedesktop.DBus.Properties.GetAll(\"";
  const Case cases[] = {
      {"devices", kDevices, "('/devices/wlan0',)"},
      {"nothing at all", kDevices, "()"},
      {"kind", properties + "org.freedesktop.NetworkManager.Device\")", "({'DeviceType': <'wifi'>},)"},
      {"properties", properties + "org.freedesktop.NetworkManager.Device\")", "(@as ['wifi'],)"},
      {"association", properties + "org.freedesktop.NetworkManager.Device.Wireless\")",
       "({'ActiveAccessPoint': <'/ap'>},)"},
  };
  PlayedDaemon manager(bus, kManager, associated());
  for (const auto& [what, call, wrong] : cases) {
    const std::string right = associated().at(call);
    manager.answer(call, wrong);
    EXPECT_EQ(sample(), kNothing) << what;
    manager.answer(call, right);
    EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54") << what;
  }
}

TEST_F(BusNetworkStatusTest, TheSupplicantsAnswersOfAnotherTypeGiveNothingAtEveryStep) {
  const std::pair<std::string, std::string> cases[] = {
      {R"(/fi/w1/wpa_supplicant1 fi.w1.wpa_supplicant1.GetInterface("wlan0"))", "('/supplicant/0',)"},
      {supplicantProperty("/supplicant/0", "Interface", "State"), "(<4>,)"},
      {supplicantProperty("/supplicant/0", "Interface", "CurrentBSS"), "(<'/bss'>,)"},
  };
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  for (const auto& [call, wrong] : cases) {
    wpa.answer(call, wrong);
    EXPECT_EQ(sample(), kNothing) << call;
    wpa.answer(call, supplicant().at(call));
  }
  wpa.answer(supplicantProperty("/bss", "BSS", "Signal"), "(<'loud'>,)");
  wpa.answer(kPoll, "(7,)");
  EXPECT_EQ(sample(), "rssi -, strength -, rate -");
}

TEST_F(BusNetworkStatusTest, ASecondQuestionIsAnsweredWithNothingAtOnceAndTheFirstGoesOn) {
  const PlayedDaemon manager(bus, kManager, associated());
  startSample();
  startSample();
  EXPECT_EQ(samples, Lines{kNothing});
  ASSERT_TRUE(runUntil([this] { return samples.size() == 2; }));
  EXPECT_EQ(samples, (Lines{kNothing, "rssi -56, strength 73, rate 54"}));
}

TEST_F(BusNetworkStatusTest, AHandlerMayAskAgain) {
  const PlayedDaemon manager(bus, kManager, associated());
  status->sampleWifi([this](const auto&) { startSample(); });
  ASSERT_TRUE(runUntil([this] { return !samples.empty(); }));
  EXPECT_EQ(samples, Lines{"rssi -56, strength 73, rate 54"});
}

TEST_F(BusNetworkStatusTest, ABusThatDiesInTheMiddleGivesNothingOnce) {
  PlayedDaemon manager(bus, kManager, associated());
  manager.answer(kDevices, "?");
  startSample();
  ASSERT_TRUE(runUntil([&] { return !manager.calls().empty(); }));
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return !samples.empty(); }));
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(samples, Lines{kNothing});
  ASSERT_EQ(log.lines.size(), 1U) << ::testing::PrintToString(log.lines);
  EXPECT_TRUE(log.lines[0].starts_with("warning: The system bus is lost: ")) << log.lines[0];
}

TEST_F(BusNetworkStatusTest, ABusThatIsBackIsAskedAgain) {
  auto manager = std::make_unique<PlayedDaemon>(bus, kManager, associated());
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
  bus.kill();
  ASSERT_TRUE(runUntil([this] { return connection.connection() == nullptr; }));
  bus.start();
  manager.reset();
  manager = std::make_unique<PlayedDaemon>(bus, kManager, associated());
  ASSERT_TRUE(runUntil([this] { return connection.connection() != nullptr; }));
  EXPECT_EQ(sample(), "rssi -56, strength 73, rate 54");
}

TEST_F(BusNetworkStatusTest, AServiceThatEndsWhileItAsksLeavesNothingBehind) {
  PlayedDaemon manager(bus, kManager, associated());
  manager.answer(kDevices, "?");
  auto passing = std::make_unique<BusNetworkStatus>(host, connection);
  passing->sampleWifi([this](const auto&) { samples.emplace_back("late"); });
  ASSERT_TRUE(runUntil([&] { return !manager.calls().empty(); }));
  passing.reset();
  manager.kill();
  runFor(std::chrono::milliseconds(50));
  EXPECT_EQ(samples, Lines{});
}

TEST_F(BusNetworkStatusTest, TheLoopWaitsForNobodyWhileEverybodyHangs) {
  PlayedDaemon manager(bus, kManager, associated());
  PlayedDaemon wpa(bus, kSupplicant, supplicant());
  EXPECT_EQ(sample(), "rssi -58, strength 73, rate 54");
  status = &prompt;
  manager.hang();
  wpa.hang();
  EXPECT_EQ(strayWaitsDuring([this] { EXPECT_EQ(sample(), kNothing); }), 0U);
  bus.hang();
  EXPECT_EQ(strayWaitsDuring([this] { EXPECT_EQ(sample(), kNothing); }), 0U);
  bus.goOn();
}

}  // namespace
}  // namespace zal::testing
