#include "platform/linux/bus/network/bus_cellular_data.h"

#include "platform/linux/bus/network/cellular_data_question.h"
#include "tests/linux/bus/bus_fixture.h"
#include "tests/support/played_daemon.h"

namespace zal::testing {
namespace {

using Answers = PlayedDaemon::Answers;

constexpr const char* kModemManager = "org.freedesktop.ModemManager1";
constexpr const char* kSwitchOwner = "org.freedesktop.NetworkManager";
constexpr const char* kOfono = "org.ofono";

BusProperties modem(std::int32_t state) { return {{"State", sdbus::Variant(state)}}; }
BusProperties cellular(std::uint32_t registration) {
  return {{"RegistrationState", sdbus::Variant(registration)}};
}
/// One modem's objects; without a registration it has no 3GPP.
ModemObjects modems(std::int32_t state, std::optional<std::uint32_t> registration) {
  ModemObjects objects;
  auto& interfaces = objects[sdbus::ObjectPath("/modem")];
  interfaces["org.freedesktop.ModemManager1.Modem"] = modem(state);
  if (registration) interfaces["org.freedesktop.ModemManager1.Modem.Modem3gpp"] = cellular(*registration);
  return objects;
}

TEST(ModemSummaryTest, AtHomeAndRoamingAreRegistered) {
  for (std::uint32_t registration = 0; registration <= 11; ++registration) {
    EXPECT_EQ(modemSummary(modems(8, registration)).isRegistered, registration == 1 || registration == 5)
        << registration;
  }
}

TEST(ModemSummaryTest, AModemWithout3gppIsRegisteredByItsState) {
  for (std::int32_t state = -1; state <= 11; ++state) {
    const ModemSummary summary = modemSummary(modems(state, std::nullopt));
    EXPECT_TRUE(summary.isThere);
    EXPECT_EQ(summary.isRegistered, state >= 8) << state;
    EXPECT_EQ(summary.isConnected, state == 11) << state;
  }
}

TEST(ModemSummaryTest, OneRegisteredModemIsEnoughAndObjectsWithoutAModemAreNone) {
  ModemObjects objects = modems(11, 1);
  objects[sdbus::ObjectPath("/another")]["org.freedesktop.ModemManager1.Modem"] = modem(3);
  EXPECT_TRUE(modemSummary(objects).isConnected);
  EXPECT_FALSE(modemSummary({}).isThere);
  ModemObjects sims;
  sims[sdbus::ObjectPath("/sim")]["org.freedesktop.ModemManager1.Sim"] = {};
  EXPECT_FALSE(modemSummary(sims).isThere);
}

TEST(ModemSummaryTest, ValuesOfAnotherTypeAreNotThere) {
  ModemObjects objects = modems(11, 1);
  for (auto& [name, properties] : objects.begin()->second) {
    for (auto& [property, value] : properties) value = sdbus::Variant(std::string("well"));
  }
  EXPECT_TRUE(modemSummary(objects).isThere);
  EXPECT_FALSE(modemSummary(objects).isRegistered);
}

class BusCellularDataTest : public BusFixture {
 protected:
  void SetUp() override {
    BusFixture::SetUp();
    if (IsSkipped()) return;
    if (const std::string obstacle = PlayedDaemon::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  }

  BusConnection connection{host, host.systemBus, "system bus"};
  BusCellularData patient{host, connection, {std::chrono::seconds(5), std::chrono::seconds(9)}};
  BusCellularData prompt{host, connection};
  BusCellularData* status = &patient;
  std::vector<std::string> answers;

  static std::string text(CellularData data) {
    switch (data) {
      case CellularData::available:
        return "available";
      case CellularData::unavailable:
        return "unavailable";
      case CellularData::noService:
        return "no service";
      case CellularData::noAnswer:
        return "no answer";
    }
    return "";
  }
  void startAsking() {
    status->ask([this](CellularData data) { answers.push_back(text(data)); });
  }
  std::string ask() {
    const std::size_t before = answers.size();
    startAsking();
    EXPECT_TRUE(runUntil([&] { return answers.size() > before; }));
    return answers.back();
  }

  static constexpr const char* kObjects =
      "/org/freedesktop/ModemManager1 org.freedesktop.DBus.ObjectManager.GetManagedObjects";
  static std::string objectsOf(int state, int registration) {
    return "({objectpath '/modem': {'org.freedesktop.ModemManager1.Modem': {'State': <int32 " +
           std::to_string(state) +
           ">}, 'org.freedesktop.ModemManager1.Modem.Modem3gpp': {'RegistrationState': <uint32 " +
           std::to_string(registration) + ">}}},)";
  }
  static constexpr const char* kNoObjects = "(@a{oa{sa{sv}}} {},)";
  static constexpr const char* kSwitch =
      R"(/org/freedesktop/NetworkManager org.freedesktop.DBus.Properties.Get("org.freedesktop.NetworkManager", "WwanEnabled"))";
  static constexpr const char* kOfonoStatus = "/ril_0 org.ofono.NetworkRegistration.GetProperties";
  static constexpr const char* kOfonoData = "/ril_0 org.ofono.ConnectionManager.GetProperties";
  static Answers ofono() {
    return {{"/ org.ofono.Manager.GetModems", "([(objectpath '/ril_0', {'Online': <true>})],)"},
            {kOfonoStatus, "({'Status': <'registered'>},)"},
            {kOfonoData, "({'Powered': <true>},)"}};
  }
};

TEST_F(BusCellularDataTest, WithoutADaemonThereIsNoServiceAndNoneIsStarted) {
  const TemporaryDirectory directory;
  for (const char* const name : {kModemManager, kSwitchOwner, kOfono}) {
    writeFile(bus.servicesDirectory() + "/" + name + ".service",
              "[D-BUS Service]\nName=" + std::string(name) + "\nExec=/usr/bin/touch " +
                  (directory / "started") + "\n");
  }
  EXPECT_EQ(ask(), "no service");
  EXPECT_EQ(listTree(directory.path()), "");
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(BusCellularDataTest, WithoutABusThereIsNoServiceAtOnce) {
  bus.kill();
  startAsking();
  EXPECT_EQ(answers, std::vector<std::string>{"no service"});
}

TEST_F(BusCellularDataTest, ARegisteredModemAndTheSwitchOfTheNetworkManagerMakeItAvailable) {
  PlayedDaemon daemon(bus, kModemManager, {{kObjects, objectsOf(8, 1)}});
  PlayedDaemon networks(bus, kSwitchOwner, {{kSwitch, "(<true>,)"}});
  EXPECT_EQ(ask(), "available");
  networks.answer(kSwitch, "(<false>,)");
  EXPECT_EQ(ask(), "unavailable");
  networks.answer(kSwitch, "(<true>,)");
  daemon.answer(kObjects, objectsOf(8, 5));
  EXPECT_EQ(ask(), "available");
  daemon.answer(kObjects, objectsOf(7, 2));
  EXPECT_EQ(ask(), "unavailable");
  daemon.answer(kObjects, kNoObjects);
  EXPECT_EQ(ask(), "unavailable");
}

TEST_F(BusCellularDataTest, WithoutTheSwitchAConnectedModemMakesItAvailable) {
  PlayedDaemon daemon(bus, kModemManager, {{kObjects, objectsOf(8, 1)}});
  EXPECT_EQ(ask(), "unavailable");
  daemon.answer(kObjects, objectsOf(11, 1));
  EXPECT_EQ(ask(), "available");
  const PlayedDaemon networks(bus, kSwitchOwner, {{kSwitch, "(<'on'>,)"}});
  EXPECT_EQ(ask(), "available");
}

TEST_F(BusCellularDataTest, OfonoIsAskedWhereNobodyElseHasAModem) {
  PlayedDaemon daemon(bus, kOfono, ofono());
  EXPECT_EQ(ask(), "available");
  daemon.answer(kOfonoStatus, "({'Status': <'roaming'>},)");
  EXPECT_EQ(ask(), "available");
  daemon.answer(kOfonoStatus, "({'Status': <'searching'>},)");
  EXPECT_EQ(ask(), "unavailable");
  daemon.answer(kOfonoStatus, "({'Status': <'registered'>},)");
  daemon.answer(kOfonoData, "({'Powered': <false>},)");
  EXPECT_EQ(ask(), "unavailable");
  daemon.answer(kOfonoData, "!org.ofono.Error.NotAvailable");
  EXPECT_EQ(ask(), "unavailable");
  daemon.answer(kOfonoData, "({'Powered': <true>},)");
  const PlayedDaemon first(bus, kModemManager, {{kObjects, kNoObjects}});
  EXPECT_EQ(ask(), "available");
}

TEST_F(BusCellularDataTest, AModemOfTheModemManagerGoesBeforeOfonos) {
  const PlayedDaemon second(bus, kOfono, ofono());
  const PlayedDaemon first(bus, kModemManager, {{kObjects, objectsOf(3, 0)}});
  EXPECT_EQ(ask(), "unavailable");
}

TEST_F(BusCellularDataTest, ADaemonThatHangsGivesNoAnswerInTimeAndIsPickedUpAgain) {
  PlayedDaemon daemon(bus, kModemManager, {{kObjects, objectsOf(11, 1)}});
  EXPECT_EQ(ask(), "available");
  status = &prompt;
  daemon.hang();
  EXPECT_EQ(ask(), "no answer");
  daemon.goOn();
  status = &patient;
  EXPECT_EQ(ask(), "available");
}

TEST_F(BusCellularDataTest, AnswersOfAnotherTypeAreNoAnswer) {
  const PlayedDaemon daemon(bus, kModemManager, {{kObjects, "('modems',)"}});
  EXPECT_EQ(ask(), "no answer");
  PlayedDaemon other(bus, kOfono, ofono());
  EXPECT_EQ(ask(), "available");
  other.answer(kOfonoStatus, "({'Status': <7>},)");
  EXPECT_EQ(ask(), "unavailable");
  other.answer("/ org.ofono.Manager.GetModems", "(true,)");
  EXPECT_EQ(ask(), "no answer");
}

TEST_F(BusCellularDataTest, ASecondQuestionIsNotAnswered) {
  const PlayedDaemon daemon(bus, kModemManager, {{kObjects, objectsOf(11, 1)}});
  startAsking();
  startAsking();
  EXPECT_EQ(answers, std::vector<std::string>{"no answer"});
  ASSERT_TRUE(runUntil([this] { return answers.size() == 2; }));
  EXPECT_EQ(answers.back(), "available");
}

}  // namespace
}  // namespace zal::testing
