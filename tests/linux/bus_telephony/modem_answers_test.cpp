#include "platform/linux/bus/telephony/modem_answers.h"

#include <gtest/gtest.h>

#include <array>
#include <functional>
#include <set>

namespace zal::testing {
namespace {

using Query = CellularQuery;
using Queries = std::set<CellularQuery>;

/// Every question that properties answer, ttyMode aside.
const Queries kAnswered = {Query::operatorName,
                           Query::providerName,
                           Query::allowedMode,
                           Query::numericNetworkCode,
                           Query::firmwareVersion,
                           Query::firmwareBaselineVersion,
                           Query::mobileIdentity,
                           Query::simIdentity,
                           Query::subscriberIdentity,
                           Query::subscriberCountryCode,
                           Query::simStatus,
                           Query::registrationStatus,
                           Query::radioAccessTechnology,
                           Query::isInHomeCountry,
                           Query::isDataAttached,
                           Query::resetState,
                           Query::isDataEnabled,
                           Query::isDataDisallowed,
                           Query::internationalDataAccess,
                           Query::packetContextCount,
                           Query::radioSelection,
                           Query::activeAndSupportedBands,
                           Query::lastKnownSubscriberCountryCode,
                           Query::subscriberNetworkCode,
                           Query::currentNetworkCountryCode,
                           Query::currentNetworkCode};

constexpr std::uint64_t operator""_u(unsigned long long number) { return number; }

class ModemAnswersTest : public ::testing::Test {
 protected:
  ModemState state{.path = "/modem",
                   .interfaces = {{kModem, ValueMap{{"Sim", "/sim"},
                                                    {"Bearers", ValueList{"/bearer"}},
                                                    {"Revision", "1.2.3"},
                                                    {"CarrierConfigurationRevision", "baseline"},
                                                    {"EquipmentIdentifier", "490154203237518"},
                                                    {"UnlockRequired", 1_u},
                                                    {"State", std::int64_t{8}},
                                                    {"AccessTechnologies", 16384_u},
                                                    {"CurrentModes", ValueList{14_u, 8_u}},
                                                    {"CurrentBands", ValueList{31_u}},
                                                    {"SupportedBands", ValueList{31_u, 33_u}}}},
                                  {kModem3gpp, ValueMap{{"OperatorName", "Test Net"},
                                                        {"OperatorCode", "00101"},
                                                        {"RegistrationState", 1_u},
                                                        {"PacketServiceState", 2_u}}}},
                   .sim = ValueMap{{"OperatorName", "Home Net"},
                                   {"SimIdentifier", "8949"},
                                   {"Imsi", "262011234567890"},
                                   {"OperatorIdentifier", "310260"}},
                   .bearers = {ValueMap{{"Connected", false}, {"Properties", ValueMap{}}}},
                   .hasNetworkManager = false,
                   .networkManager = std::nullopt};

  std::optional<CellularAnswer> ask(CellularQuery query) const { return modemAnswer(query, state); }
  Value valueOf(CellularQuery query) const {
    const auto answer = ask(query);
    EXPECT_TRUE(answer);
    return answer ? answer->value : Value();
  }
  bool fails(CellularQuery query) const { return !ask(query); }
  bool hasNoValue(CellularQuery query) const {
    const auto answer = ask(query);
    return answer && answer->value == Value();
  }
  void set(const char* interface, const char* name, Value value) {
    std::get<ValueMap>(state.interfaces[interface].storage).insert_or_assign(name, std::move(value));
  }
  void setSim(const char* name, Value value) { state.sim->insert_or_assign(name, std::move(value)); }
  void setNetworkManager(bool isEnabled, bool isHardwareEnabled) {
    state.hasNetworkManager = true;
    state.networkManager = ValueMap{{"WwanEnabled", isEnabled}, {"WwanHardwareEnabled", isHardwareEnabled}};
  }
  Queries failing() const {
    Queries queries;
    for (const CellularQuery query : kAnswered) {
      if (fails(query)) queries.insert(query);
    }
    return queries;
  }
};

TEST_F(ModemAnswersTest, EveryPropertyHasItsAnswer) {
  EXPECT_EQ(failing(), Queries{});
  EXPECT_EQ(valueOf(Query::operatorName), Value("Test Net"));
  EXPECT_EQ(valueOf(Query::providerName), Value("Home Net"));
  EXPECT_EQ(valueOf(Query::allowedMode), Value("2g|3g|4g"));
  EXPECT_EQ(valueOf(Query::numericNetworkCode), Value("00101"));
  EXPECT_EQ(valueOf(Query::firmwareVersion), Value("1.2.3"));
  EXPECT_EQ(valueOf(Query::firmwareBaselineVersion), Value("baseline"));
  EXPECT_EQ(valueOf(Query::mobileIdentity), Value("490154203237518"));
  EXPECT_EQ(valueOf(Query::simIdentity), Value("8949"));
  EXPECT_EQ(valueOf(Query::subscriberIdentity), Value("262011234567890"));
  EXPECT_EQ(valueOf(Query::subscriberCountryCode), Value("310"));
  EXPECT_EQ(valueOf(Query::simStatus), Value("none"));
  EXPECT_EQ(valueOf(Query::registrationStatus), Value("home"));
  EXPECT_EQ(valueOf(Query::radioAccessTechnology), Value("lte"));
  EXPECT_EQ(valueOf(Query::isInHomeCountry), Value(false));
  EXPECT_EQ(valueOf(Query::isDataAttached), Value(true));
  EXPECT_EQ(valueOf(Query::resetState), Value(false));
  EXPECT_EQ(valueOf(Query::isDataEnabled), Value(false));
  EXPECT_EQ(valueOf(Query::isDataDisallowed), Value(false));
  EXPECT_EQ(valueOf(Query::internationalDataAccess), Value(true));
  EXPECT_EQ(valueOf(Query::packetContextCount), Value(1));
  EXPECT_EQ(valueOf(Query::radioSelection), Value("2g|3g|4g"));
  EXPECT_EQ(ask(Query::radioSelection)->second, Value("4g"));
  EXPECT_EQ(valueOf(Query::activeAndSupportedBands),
            Value(ValueMap{{"active", ValueList{31_u}}, {"supported", ValueList{31_u, 33_u}}}));
  EXPECT_EQ(valueOf(Query::lastKnownSubscriberCountryCode), Value("310"));
  EXPECT_EQ(valueOf(Query::subscriberNetworkCode), Value("260"));
  EXPECT_EQ(valueOf(Query::currentNetworkCountryCode), Value("001"));
  EXPECT_EQ(valueOf(Query::currentNetworkCode), Value("01"));
}

TEST_F(ModemAnswersTest, WhatNoPropertyAnswersFails) {
  for (const Query query :
       {Query::ttyMode, Query::bootloaderVersion, Query::serviceCenterAddress, Query::servingCellId}) {
    EXPECT_TRUE(fails(query));
  }
}

TEST_F(ModemAnswersTest, AModemWithoutA3gppInterfaceFailsItsRowsAlone) {
  state.interfaces.erase(kModem3gpp);
  EXPECT_EQ(failing(), (Queries{Query::operatorName, Query::numericNetworkCode, Query::registrationStatus,
                                Query::isInHomeCountry, Query::isDataAttached, Query::isDataDisallowed,
                                Query::currentNetworkCountryCode, Query::currentNetworkCode}));
}

TEST_F(ModemAnswersTest, ACardThatCannotBeReadFailsItsRowsAlone) {
  state.sim = std::nullopt;
  EXPECT_EQ(failing(), (Queries{Query::providerName, Query::simIdentity, Query::subscriberIdentity,
                                Query::subscriberCountryCode, Query::isInHomeCountry,
                                Query::lastKnownSubscriberCountryCode, Query::subscriberNetworkCode}));
  EXPECT_EQ(valueOf(Query::simStatus), Value("none"));
}

TEST_F(ModemAnswersTest, NoCardHasNoIdentityAndTheLaterRowsStay) {
  set(kModem, "Sim", "/");
  state.sim = std::nullopt;
  for (const Query query :
       {Query::providerName, Query::simIdentity, Query::subscriberIdentity, Query::subscriberCountryCode,
        Query::lastKnownSubscriberCountryCode, Query::subscriberNetworkCode}) {
    EXPECT_TRUE(hasNoValue(query));
  }
  EXPECT_EQ(failing(), Queries{Query::isInHomeCountry});
  EXPECT_EQ(valueOf(Query::simStatus), Value("sim-missing"));
}

TEST_F(ModemAnswersTest, NoModemFailsEverything) {
  state = ModemState{};
  EXPECT_EQ(failing(), kAnswered);
}

TEST_F(ModemAnswersTest, AnotherTypeFails) {
  for (const char* interface : {kModem, kModem3gpp}) {
    for (auto& property : std::get<ValueMap>(state.interfaces[interface].storage)) property.second = 1.5;
  }
  for (auto& property : *state.sim) property.second = 1.5;
  for (auto& property : *state.bearers.front()) property.second = 1.5;
  EXPECT_EQ(failing(), kAnswered);
}

TEST_F(ModemAnswersTest, AnEmptyTextHasNoValue) {
  for (const char* name : {"Revision", "CarrierConfigurationRevision", "EquipmentIdentifier"}) {
    set(kModem, name, "");
  }
  for (const char* name : {"OperatorName", "OperatorCode"}) set(kModem3gpp, name, "");
  for (const char* name : {"OperatorName", "SimIdentifier", "Imsi", "OperatorIdentifier"}) setSim(name, "");
  for (const Query query :
       {Query::operatorName, Query::providerName, Query::numericNetworkCode, Query::firmwareVersion,
        Query::firmwareBaselineVersion, Query::mobileIdentity, Query::simIdentity, Query::subscriberIdentity,
        Query::subscriberCountryCode, Query::lastKnownSubscriberCountryCode, Query::subscriberNetworkCode,
        Query::currentNetworkCountryCode, Query::currentNetworkCode}) {
    EXPECT_TRUE(hasNoValue(query));
  }
  EXPECT_EQ(failing(), Queries{Query::isInHomeCountry});
}

TEST_F(ModemAnswersTest, TheSubscribersCountryComesFromTheIdentityWhereTheCardNamesNoOperator) {
  setSim("OperatorIdentifier", "");
  EXPECT_EQ(valueOf(Query::subscriberCountryCode), Value("262"));
  state.sim->erase("OperatorIdentifier");
  EXPECT_EQ(valueOf(Query::subscriberCountryCode), Value("262"));
  EXPECT_TRUE(fails(Query::lastKnownSubscriberCountryCode));
}

TEST_F(ModemAnswersTest, ACodeThatIsNoneFails) {
  for (const char* code : {"0010", "0010101", "00a01", "- 101"}) {
    set(kModem3gpp, "OperatorCode", code);
    EXPECT_TRUE(fails(Query::currentNetworkCountryCode)) << code;
    EXPECT_TRUE(fails(Query::currentNetworkCode)) << code;
    EXPECT_TRUE(fails(Query::isInHomeCountry)) << code;
  }
}

TEST_F(ModemAnswersTest, HomeIsTheCountryAndNotTheNetwork) {
  set(kModem3gpp, "OperatorCode", "31001");
  EXPECT_EQ(valueOf(Query::isInHomeCountry), Value(true));
}

TEST_F(ModemAnswersTest, DataThatIsDetachedIsNoAndUnknownFails) {
  set(kModem3gpp, "PacketServiceState", 1_u);
  EXPECT_EQ(valueOf(Query::isDataAttached), Value(false));
  set(kModem3gpp, "PacketServiceState", 0_u);
  EXPECT_TRUE(fails(Query::isDataAttached));
}

TEST_F(ModemAnswersTest, AModemThatFailedOrInitializesIsInReset) {
  for (const auto& [step, isReset] : {std::pair{-1, true}, {0, false}, {1, true}, {2, false}, {11, false}}) {
    set(kModem, "State", std::int64_t{step});
    EXPECT_EQ(valueOf(Query::resetState), Value(isReset)) << step;
  }
}

TEST_F(ModemAnswersTest, DataIsEnabledBySwitchWhereThereIsNetworkManager) {
  setNetworkManager(true, true);
  EXPECT_EQ(valueOf(Query::isDataEnabled), Value(true));
  setNetworkManager(false, true);
  state.bearers.front()->insert_or_assign("Connected", true);
  EXPECT_EQ(valueOf(Query::isDataEnabled), Value(false));
  state.networkManager = std::nullopt;
  EXPECT_TRUE(fails(Query::isDataEnabled));
}

TEST_F(ModemAnswersTest, DataIsEnabledByAnyConnectedBearerWithoutNetworkManager) {
  state.bearers.push_back(std::nullopt);
  EXPECT_TRUE(fails(Query::isDataEnabled));  // one that cannot be read may be connected
  state.bearers.push_back(ValueMap{{"Connected", true}});
  EXPECT_EQ(valueOf(Query::isDataEnabled), Value(true));
  state.bearers.clear();
  EXPECT_EQ(valueOf(Query::isDataEnabled), Value(false));
}

TEST_F(ModemAnswersTest, DataIsDisallowedByTheSwitchOrByTheNetwork) {
  setNetworkManager(true, true);
  EXPECT_EQ(valueOf(Query::isDataDisallowed), Value(false));
  setNetworkManager(true, false);
  EXPECT_EQ(valueOf(Query::isDataDisallowed), Value(true));
  state.networkManager = std::nullopt;
  EXPECT_TRUE(fails(Query::isDataDisallowed));
  set(kModem3gpp, "RegistrationState", 3_u);
  EXPECT_EQ(valueOf(Query::isDataDisallowed), Value(true));
}

TEST_F(ModemAnswersTest, RoamingIsTheFirstBearersToAllow) {
  state.bearers.front()->insert_or_assign("Properties", ValueMap{{"allow-roaming", false}});
  state.bearers.push_back(ValueMap{{"Properties", ValueMap{{"allow-roaming", true}}}});
  EXPECT_EQ(valueOf(Query::internationalDataAccess), Value(false));
  state.bearers.front() = std::nullopt;
  EXPECT_TRUE(fails(Query::internationalDataAccess));
  state.bearers.clear();
  EXPECT_TRUE(fails(Query::internationalDataAccess));
}

TEST_F(ModemAnswersTest, BearersAreCountedAlsoWhereTheyCannotBeRead) {
  set(kModem, "Bearers", ValueList{"/a", "/b", "/c"});
  state.bearers.clear();
  EXPECT_EQ(valueOf(Query::packetContextCount), Value(3));
}

TEST(ModemCallsTest, TheBootLoaderIsTheSelectedImages) {
  const auto image = [](const char* name, Value version) {
    return ValueMap{{"unique-id", name}, {"gobi-boot-version", std::move(version)}};
  };
  const ValueMap plain{{"unique-id", "c"}};
  EXPECT_EQ(bootloaderAnswer({"b", ValueList{image("a", "1"), image("b", "2")}})->value, Value("2"));
  EXPECT_EQ(bootloaderAnswer({"c", ValueList{plain, image("a", "1")}})->value, Value("1"));
  EXPECT_EQ(bootloaderAnswer({"c", ValueList{plain}})->value, Value());
  EXPECT_EQ(bootloaderAnswer({"", ValueList{}})->value, Value());
  EXPECT_EQ(bootloaderAnswer({"a", ValueList{image("a", ""), 7}})->value, Value());
  EXPECT_FALSE(bootloaderAnswer({}));
  EXPECT_FALSE(bootloaderAnswer({ValueList{}, "b"}));
}

TEST(ModemCallsTest, TheServiceCentreStandsBetweenQuotes) {
  EXPECT_EQ(serviceCenterAnswer({"+CSCA: \"+15550001\",145"})->value, Value("+15550001"));
  EXPECT_EQ(serviceCenterAnswer({"+CSCA: \"\",129"})->value, Value());
  for (const char* nonsense : {"", "OK", "+CSCA: ", "+CSCA: \"+1555", "\"+15550001\""}) {
    EXPECT_FALSE(serviceCenterAnswer({nonsense})) << nonsense;
  }
  EXPECT_FALSE(serviceCenterAnswer({}));
  EXPECT_FALSE(serviceCenterAnswer({7}));
}

TEST(ModemCallsTest, TheCellIsTheFourthFieldInHexadecimal) {
  const auto cell = [](Value location) { return servingCellAnswer({ValueMap{{"1", std::move(location)}}}); };
  EXPECT_EQ(cell("001,01,0,27DB,3DB")->value, Value(0x27DB));
  EXPECT_EQ(cell("310,260,8BE3,00002BAF,000000")->value, Value(0x2BAF));
  EXPECT_EQ(cell("310,260,8BE3,FFFFFFF")->value, Value(0xFFFFFFF));
  for (const char* nonsense : {"", "310", "310,260,8BE3", "310,260,8BE3,,0", "1,2,3,4x,5", "1,2,3,-4,5",
                               "1,2,3,1234567890ABCDEF01,5"}) {
    EXPECT_FALSE(cell(nonsense)) << nonsense;
  }
  EXPECT_FALSE(cell(7));
  EXPECT_FALSE(servingCellAnswer({ValueMap{}}));
  EXPECT_FALSE(servingCellAnswer({}));
}

}  // namespace
}  // namespace zal::testing
