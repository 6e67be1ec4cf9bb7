#include "platform/linux/bus/telephony/modem_state.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

std::string pathOf(int number) { return std::string(kModemManagerPath) + "/Modem/" + std::to_string(number); }

/// One modem's interfaces, in the state.
ValueMap modemIn(std::int64_t state) { return {{kModem, ValueMap{{"State", state}}}}; }

ModemState modemWith(ValueMap interfaces) { return modemInUse({{pathOf(0), std::move(interfaces)}}); }

ValueMap signalOf(const char* technology, Value rssi) {
  return {{technology, ValueMap{{"rssi", std::move(rssi)}}}};
}

const ValueMap kEightyPercent{{"SignalQuality", ValueList{std::uint64_t{80}, true}}};

TEST(ModemStateTest, ARegisteredModemGoesBeforeAnEnabledOneAndThatBeforeTheFirst) {
  EXPECT_EQ(modemInUse({{pathOf(0), modemIn(3)}, {pathOf(1), modemIn(6)}, {pathOf(2), modemIn(8)}}).path,
            pathOf(2));
  EXPECT_EQ(modemInUse({{pathOf(0), modemIn(3)}, {pathOf(1), modemIn(7)}}).path, pathOf(1));
  EXPECT_EQ(modemInUse({{pathOf(0), modemIn(5)}, {pathOf(1), modemIn(-1)}}).path, pathOf(0));
  EXPECT_EQ(modemInUse({{pathOf(0), modemIn(11)}, {pathOf(1), modemIn(8)}}).path, pathOf(0));
}

TEST(ModemStateTest, PathsAreInTheOrderOfTheirNumbers) {
  EXPECT_EQ(modemInUse({{pathOf(10), modemIn(8)}, {pathOf(9), modemIn(8)}}).path, pathOf(9));
}

TEST(ModemStateTest, ObjectsThatAreNoModemsDoNotCount) {
  const ValueMap sim{{kSim, ValueMap{}}};
  EXPECT_EQ(modemInUse({{"/a", sim}, {"/b", "nonsense"}}).path, "");
  EXPECT_EQ(modemInUse({{"/a", sim}, {"/c", modemIn(1)}}).path, "/c");
  EXPECT_EQ(modemInUse({}).path, "");
}

TEST(ModemStateTest, AMissingInterfaceOrAnotherTypeIsNoProperty) {
  const ModemState modem = modemWith({{kModem, ValueMap{{"Revision", "1.2.3"}}}, {kModem3gpp, "nonsense"}});
  EXPECT_EQ(*modem.property<std::string>(kModem, "Revision"), "1.2.3");
  EXPECT_EQ(modem.property<std::uint64_t>(kModem, "Revision"), nullptr);
  EXPECT_EQ(modem.property<std::string>(kModem, "Model"), nullptr);
  EXPECT_EQ(modem.property<std::string>(kModem3gpp, "OperatorName"), nullptr);
  EXPECT_EQ(modem.property<ValueMap>(kModemSignal, "Lte"), nullptr);
}

TEST(ModemStateTest, ACardIsMissingOnlyWhereTheModemSaysSo) {
  EXPECT_TRUE(modemWith({{kModem, ValueMap{{"Sim", "/"}}}}).isWithoutSim());
  EXPECT_FALSE(modemWith({{kModem, ValueMap{{"Sim", "/sim"}}}}).isWithoutSim());
  EXPECT_FALSE(modemWith({{kModem, ValueMap{}}}).isWithoutSim());
}

TEST(ModemStateTest, BearerPathsAreTheTextsOfTheList) {
  const ModemState modem = modemWith({{kModem, ValueMap{{"Bearers", ValueList{"/b/0", true, "/b/1"}}}}});
  EXPECT_EQ(modem.bearerPaths(), (std::vector<std::string>{"/b/0", "/b/1"}));
  EXPECT_EQ(modemWith({{kModem, ValueMap{{"Bearers", "/b/0"}}}}).bearerPaths(), std::vector<std::string>{});
}

TEST(ModemStateTest, ThePowerIsTheFirstMeasuredOne) {
  ValueMap signal = signalOf("Gsm", -90.0);
  signal.merge(signalOf("Umts", -80.0));
  EXPECT_EQ(modemSignal(modemWith({{kModem, kEightyPercent}, {kModemSignal, signal}}))->rssi, -80);
  signal.insert_or_assign("Lte", ValueMap{{"rsrp", -101.0}});  // no rssi: the next one is asked
  EXPECT_EQ(modemSignal(modemWith({{kModem, kEightyPercent}, {kModemSignal, signal}}))->rssi, -80);
  signal.insert_or_assign("Lte", ValueMap{{"rssi", -70.0}});
  EXPECT_EQ(modemSignal(modemWith({{kModem, kEightyPercent}, {kModemSignal, signal}}))->rssi, -70);
}

TEST(ModemStateTest, APowerThatIsNoNumberIsDerived) {
  const ValueMap signal = signalOf("Lte", "strong");
  EXPECT_EQ(modemSignal(modemWith({{kModem, kEightyPercent}, {kModemSignal, signal}}))->rssi, -63);
  EXPECT_EQ(modemSignal(modemWith({{kModem, kEightyPercent}}))->rssi, -63);
}

TEST(ModemStateTest, AStrengthOfAnotherTypeIsNone) {
  for (const Value& quality : {Value("80"), Value(ValueList{}), Value(ValueList{"80", true}),
                               Value(ValueList{std::int64_t{80}, true}), Value(80)}) {
    EXPECT_FALSE(modemSignal(modemWith({{kModem, ValueMap{{"SignalQuality", quality}}}})));
  }
  EXPECT_FALSE(modemSignal(ModemState{}));
}

TEST(ModemStateTest, AStrengthBeyondTheScaleIsItsEnd) {
  const ValueMap quality{{"SignalQuality", ValueList{std::uint64_t{4294967295}, true}}};
  EXPECT_EQ(modemSignal(modemWith({{kModem, quality}}))->percentage, 100);
}

}  // namespace
}  // namespace zal::testing
