#include "platform/linux/bus/telephony/ofono_answers.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using Query = CellularQuery;

/// A modem whose interfaces a test fills.
class OfonoAnswersTest : public ::testing::Test {
 protected:
  std::map<std::string, OfonoProperties> interfaces = {
      {"Modem", {}},         {"NetworkRegistration", {}}, {"SimManager", {}},   {"ConnectionManager", {}},
      {"RadioSettings", {}}, {"MessageManager", {}},      {"TextTelephony", {}}};

  std::optional<CellularAnswer> answer(Query query) const {
    return ofonoAnswer(query, [this](const std::string& name) -> const OfonoProperties* {
      const auto found = interfaces.find(name);
      return found != interfaces.end() ? &found->second : nullptr;
    });
  }
  /// The answer's value; the test fails where there is none.
  Value value(Query query) const {
    const auto given = answer(query);
    EXPECT_TRUE(given.has_value());
    return given ? given->value : Value("failed");
  }
  void set(const std::string& interface, const std::string& name, const sdbus::Variant& value) {
    interfaces[interface][name] = value;
  }
  static sdbus::Variant text(const std::string& words) { return sdbus::Variant(words); }
};

TEST_F(OfonoAnswersTest, TextsAreGivenAsTheyAre) {
  set("NetworkRegistration", "Name", text("Home Net"));
  set("NetworkRegistration", "Status", text("roaming"));
  set("RadioSettings", "TechnologyPreference", text("lte"));
  EXPECT_EQ(value(Query::operatorName), Value("Home Net"));
  EXPECT_EQ(value(Query::registrationStatus), Value("roaming"));
  EXPECT_EQ(value(Query::allowedMode), Value("lte"));
}

TEST_F(OfonoAnswersTest, ATextThatIsLeftOutOrEmptyHasNoValue) {
  set("NetworkRegistration", "Name", text(""));
  EXPECT_EQ(value(Query::operatorName), Value());
  EXPECT_EQ(value(Query::providerName), Value());
}

TEST_F(OfonoAnswersTest, AMissingInterfaceFailsItsOwnQuestionsOnly) {
  interfaces.erase("RadioSettings");
  set("SimManager", "Present", sdbus::Variant(true));
  set("SimManager", "PinRequired", text("none"));
  EXPECT_FALSE(answer(Query::allowedMode));
  EXPECT_FALSE(answer(Query::radioSelection));
  EXPECT_FALSE(answer(Query::activeAndSupportedBands));
  EXPECT_EQ(value(Query::simStatus), Value("none"));
}

TEST_F(OfonoAnswersTest, APropertyOfAnotherTypeFailsItsOwnQuestionOnly) {
  set("NetworkRegistration", "Name", sdbus::Variant(true));
  set("NetworkRegistration", "CellId", text("10203"));
  set("NetworkRegistration", "Status", text("registered"));
  EXPECT_FALSE(answer(Query::operatorName));
  EXPECT_FALSE(answer(Query::servingCellId));
  EXPECT_EQ(value(Query::registrationStatus), Value("registered"));
}

TEST_F(OfonoAnswersTest, AYesOrNoThatIsLeftOutIsNotTakenForNo) {
  EXPECT_FALSE(answer(Query::isDataAttached));
  EXPECT_FALSE(answer(Query::isDataEnabled));
  EXPECT_FALSE(answer(Query::internationalDataAccess));
  EXPECT_FALSE(answer(Query::ttyMode));
  EXPECT_FALSE(answer(Query::resetState));
  EXPECT_FALSE(answer(Query::servingCellId));
}

TEST_F(OfonoAnswersTest, WhetherDataAreSuspendedHasNoValueWhileTheyAreNotAttached) {
  EXPECT_EQ(value(Query::isDataDisallowed), Value());
  set("ConnectionManager", "Suspended", sdbus::Variant(true));
  EXPECT_EQ(value(Query::isDataDisallowed), Value(true));
}

TEST_F(OfonoAnswersTest, TheNetworksCodeIsBothItsHalvesOrNothing) {
  set("NetworkRegistration", "MobileCountryCode", text("262"));
  EXPECT_EQ(value(Query::numericNetworkCode), Value());
  set("NetworkRegistration", "MobileNetworkCode", text("02"));
  EXPECT_EQ(value(Query::numericNetworkCode), Value("26202"));
  EXPECT_EQ(value(Query::currentNetworkCountryCode), Value("262"));
  EXPECT_EQ(value(Query::currentNetworkCode), Value("02"));
}

TEST_F(OfonoAnswersTest, TheCountryIsHomeWhereCardAndNetworkAgree) {
  EXPECT_FALSE(answer(Query::isInHomeCountry));
  set("SimManager", "MobileCountryCode", text("262"));
  EXPECT_FALSE(answer(Query::isInHomeCountry));
  set("NetworkRegistration", "MobileCountryCode", text("208"));
  EXPECT_EQ(value(Query::isInHomeCountry), Value(false));
  set("NetworkRegistration", "MobileCountryCode", text("262"));
  EXPECT_EQ(value(Query::isInHomeCountry), Value(true));
}

TEST_F(OfonoAnswersTest, WithoutACardTheStatusSaysSoAndTheCardsTextsHaveNoValue) {
  set("SimManager", "Present", sdbus::Variant(false));
  EXPECT_EQ(value(Query::simStatus), Value("sim-missing"));
  EXPECT_EQ(value(Query::simIdentity), Value());
  EXPECT_EQ(value(Query::subscriberIdentity), Value());
}

TEST_F(OfonoAnswersTest, ACardThatWantsItsNumberSaysWhich) {
  set("SimManager", "Present", sdbus::Variant(true));
  set("SimManager", "PinRequired", text("pin"));
  EXPECT_EQ(value(Query::simStatus), Value("pin"));
}

TEST_F(OfonoAnswersTest, AModemThatHasPowerButIsNotOnlineIsBeingReset) {
  struct Case {
    bool powered, online, resets;
  };
  for (const Case& each : {Case{true, true, false}, {true, false, true}, {false, false, false}}) {
    set("Modem", "Powered", sdbus::Variant(each.powered));
    set("Modem", "Online", sdbus::Variant(each.online));
    EXPECT_EQ(value(Query::resetState), Value(each.resets));
  }
}

TEST_F(OfonoAnswersTest, OneSettingIsSelectionAndPreferenceOfTheRadio) {
  set("RadioSettings", "TechnologyPreference", text("umts"));
  const auto given = answer(Query::radioSelection);
  ASSERT_TRUE(given);
  EXPECT_EQ(given->value, Value("umts"));
  EXPECT_EQ(given->second, Value("umts"));
}

TEST_F(OfonoAnswersTest, BandsAreADictionaryOfThoseThatAreThere) {
  EXPECT_EQ(value(Query::activeAndSupportedBands), Value());
  set("RadioSettings", "UmtsBand", text("1900"));
  EXPECT_EQ(value(Query::activeAndSupportedBands), Value(ValueMap{{"UmtsBand", "1900"}}));
  set("RadioSettings", "GsmBand", text("any"));
  EXPECT_EQ(value(Query::activeAndSupportedBands), Value(ValueMap{{"GsmBand", "any"}, {"UmtsBand", "1900"}}));
}

TEST_F(OfonoAnswersTest, BaselineAndBootLoaderAreUnknownToOfono) {
  EXPECT_FALSE(answer(Query::firmwareBaselineVersion));
  EXPECT_FALSE(answer(Query::bootloaderVersion));
}

TEST_F(OfonoAnswersTest, TheSignalIsAByteOfPercent) {
  const auto signal = [](const sdbus::Variant& strength) { return ofonoSignal({{"Strength", strength}}); };
  const auto strong = signal(sdbus::Variant(std::uint8_t{80}));
  ASSERT_TRUE(strong);
  EXPECT_EQ(strong->percentage, 80);
  EXPECT_EQ(strong->rssi, -63);
  EXPECT_EQ(strong->graded, 3);
  EXPECT_TRUE(signal(sdbus::Variant(std::uint8_t{100})));
  EXPECT_FALSE(signal(sdbus::Variant(std::uint8_t{101})));
  EXPECT_FALSE(signal(sdbus::Variant(std::int32_t{80})));
  EXPECT_FALSE(ofonoSignal({}));
}

}  // namespace
}  // namespace zal::testing
