#include "collectors/cellular_snapshot.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <string>
#include <vector>

#include "tests/support/fake_dump_services.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Query = CellularQuery;

/// Every query in the order in which it is asked, with the keys that it fills.
struct Asked {
  Query query;
  std::vector<std::string> keys;
};
const std::vector<Asked> kAsked = {
    {Query::operatorName, {"operator-name"}},
    {Query::providerName, {"provider-name"}},
    {Query::allowedMode, {"allowed-mode"}},
    {Query::numericNetworkCode, {"numeric-network-code-mode"}},
    {Query::firmwareVersion, {"firmware-version"}},
    {Query::firmwareBaselineVersion, {"firmware-baseline-version"}},
    {Query::bootloaderVersion, {"bootloader-version"}},
    {Query::mobileIdentity, {"mobile-identity"}},
    {Query::simIdentity, {"sim-identity"}},
    {Query::subscriberIdentity, {"subscriber-identity"}},
    {Query::subscriberCountryCode, {"subscriber-country-code"}},
    {Query::simStatus, {"sim-status"}},
    {Query::registrationStatus, {"registration-status"}},
    {Query::radioAccessTechnology, {"radio-rat"}},
    {Query::serviceCenterAddress, {"service-center-address"}},
    {Query::isInHomeCountry, {"home-country"}},
    {Query::ttyMode, {"tty-mode"}},
    {Query::isDataAttached, {"data-attached"}},
    {Query::resetState, {"reset-state"}},
    {Query::isDataEnabled, {"data-enabled"}},
    {Query::isDataDisallowed, {"data-disallowed"}},
    {Query::internationalDataAccess, {"international-data-enabled"}},
    {Query::servingCellId, {"cell-id"}},
    {Query::packetContextCount, {"packet-context-count"}},
    {Query::radioSelection, {"rat-selection", "rat-preferred"}},
    {Query::activeAndSupportedBands, {"active-supported-bands"}},
    {Query::lastKnownSubscriberCountryCode, {"sim-mcc"}},
    {Query::subscriberNetworkCode, {"sim-mnc"}},
    {Query::currentNetworkCountryCode, {"network-mcc"}},
    {Query::currentNetworkCode, {"network-mnc"}},
};
const std::set<Query> kYesOrNo = {
    Query::isInHomeCountry, Query::ttyMode,          Query::isDataAttached,         Query::resetState,
    Query::isDataEnabled,   Query::isDataDisallowed, Query::internationalDataAccess};

class CellularSnapshotTest : public ::testing::Test {
 protected:
  CellularSnapshotTest() {
    telephony.reachable = true;
    telephony.signal = CellularSignal{.rssi = -71, .percentage = 62, .graded = 3};
  }
  /// Each query gives the names of its keys, or yes where it is a question of yes or no.
  void answerEverything() {
    for (const Asked& asked : kAsked) {
      CellularAnswer answer{.value = asked.keys.front(), .second = {}};
      if (kYesOrNo.contains(asked.query)) answer.value = true;
      if (asked.keys.size() == 2) answer.second = asked.keys.back();
      telephony.answers.emplace(asked.query, answer);
    }
  }
  static ValueMap signalAnd(ValueMap rest) {
    rest.insert({{"rssi", std::int64_t{-71}}, {"percentage", std::int64_t{62}}, {"graded", std::int64_t{3}}});
    return rest;
  }
  FakeTelephony telephony;
  FakePropertyListWriter propertyLists;
  RecordingAgentLog log;
  CellularSnapshot snapshot{telephony, propertyLists, log};
};

TEST_F(CellularSnapshotTest, AsksEveryQueryOnceInItsOrderOverOneConnection) {
  (void)snapshot.CopyCellularState();
  std::vector<Query> expected;
  for (const Asked& asked : kAsked) expected.push_back(asked.query);
  EXPECT_EQ(telephony.asked, expected);
  EXPECT_EQ(telephony.open, 0);
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(CellularSnapshotTest, EachQueryFillsItsOwnKeys) {
  answerEverything();
  ValueMap expected;
  for (const Asked& asked : kAsked) {
    for (const auto& key : asked.keys) expected.emplace(key, kYesOrNo.contains(asked.query) ? "YES" : key);
  }
  const ValueMap state = snapshot.CopyCellularState();
  EXPECT_EQ(state.size(), 34U);
  EXPECT_EQ(state, signalAnd(expected));
}

TEST_F(CellularSnapshotTest, AQueryThatFailsMarksItsOwnKeysAlone) {
  for (const Asked& failing : kAsked) {
    telephony.answers.clear();
    answerEverything();
    ValueMap expected = snapshot.CopyCellularState();
    for (const auto& key : failing.keys) expected[key] = "FAILED";
    telephony.answers.erase(failing.query);
    EXPECT_EQ(snapshot.CopyCellularState(), expected) << failing.keys.front();
  }
}

TEST_F(CellularSnapshotTest, AFailedSignalQueryMarksItsThreeKeysAlone) {
  answerEverything();
  ValueMap expected = snapshot.CopyCellularState();
  for (const char* key : {"rssi", "percentage", "graded"}) expected[key] = "FAILED";
  telephony.signal.reset();
  EXPECT_EQ(snapshot.CopyCellularState(), expected);
}

TEST_F(CellularSnapshotTest, AQueryThatGivesNoValueLeavesItsKeyOut) {
  answerEverything();
  ValueMap expected = snapshot.CopyCellularState();
  for (const Asked& asked : kAsked) {
    if (kYesOrNo.contains(asked.query)) continue;
    telephony.answers[asked.query] = {};
    for (const auto& key : asked.keys) expected.erase(key);
  }
  EXPECT_EQ(snapshot.CopyCellularState(), expected);
  EXPECT_EQ(expected.size(), 3U + 7U);
}

TEST_F(CellularSnapshotTest, HalfOfTheRadioSelectionIsKept) {
  telephony.answers[Query::radioSelection] = {.value = {}, .second = std::int64_t{7}};
  const ValueMap state = snapshot.CopyCellularState();
  EXPECT_FALSE(state.contains("rat-selection"));
  EXPECT_EQ(state.at("rat-preferred"), Value(std::int64_t{7}));
}

TEST_F(CellularSnapshotTest, ABooleanQueryAnsweringFalseYieldsNoNeverAnAbsentKey) {
  for (const Query query : kYesOrNo) telephony.answers[query] = {.value = false, .second = {}};
  const ValueMap state = snapshot.CopyCellularState();
  for (const Asked& asked : kAsked) {
    if (!kYesOrNo.contains(asked.query)) continue;
    EXPECT_EQ(state.at(asked.keys.front()), Value("NO"));
  }
}

TEST_F(CellularSnapshotTest, ABooleanQueryThatSucceedsWithoutAnAnswerYieldsNo) {
  for (const Query query : kYesOrNo) telephony.answers[query] = {};
  const ValueMap state = snapshot.CopyCellularState();
  EXPECT_EQ(std::count_if(state.begin(), state.end(), [](const auto& e) { return e.second == Value("NO"); }),
            7);
}

TEST_F(CellularSnapshotTest, ValuesStayAsTheServiceGivesThem) {
  const Value bands = ValueMap{{"active", ValueList{std::int64_t{1}, std::int64_t{20}}}, {"mode", 2.5}};
  telephony.answers[Query::activeAndSupportedBands] = {.value = bands, .second = {}};
  telephony.answers[Query::servingCellId] = {.value = std::int64_t{268435455}, .second = {}};
  telephony.answers[Query::packetContextCount] = {.value = std::uint64_t{2}, .second = {}};
  telephony.answers[Query::operatorName] = {.value = "", .second = {}};
  const ValueMap state = snapshot.CopyCellularState();
  EXPECT_EQ(state.at("active-supported-bands"), bands);
  EXPECT_EQ(state.at("cell-id"), Value(std::int64_t{268435455}));
  EXPECT_EQ(state.at("packet-context-count"), Value(std::uint64_t{2}));
  EXPECT_EQ(state.at("operator-name"), Value(""));
}

TEST_F(CellularSnapshotTest, WithoutASimTheIdentitiesAreAbsentOrFailedAndLaterRowsAreThere) {
  answerEverything();
  telephony.answers[Query::simIdentity] = {};
  telephony.answers.erase(Query::subscriberIdentity);
  telephony.answers.erase(Query::subscriberCountryCode);
  const ValueMap state = snapshot.CopyCellularState();
  EXPECT_FALSE(state.contains("sim-identity"));
  EXPECT_EQ(state.at("subscriber-identity"), Value("FAILED"));
  EXPECT_EQ(state.at("subscriber-country-code"), Value("FAILED"));
  EXPECT_EQ(state.at("sim-status"), Value("sim-status"));
  EXPECT_EQ(state.at("network-mnc"), Value("network-mnc"));
}

TEST_F(CellularSnapshotTest, WithTheServiceStoppedTheFileHoldsAnEmptyDictionaryAndTheLogTheWarning) {
  telephony.reachable = false;
  const TemporaryDirectory directory;
  snapshot.WriteCellularState(directory.path());
  ASSERT_EQ(propertyLists.written.size(), 1U);
  EXPECT_EQ(propertyLists.written[0].second, ValueMap{});
  EXPECT_EQ(listTree(directory.path()), "CTState.plist\n");
  EXPECT_EQ(log.lines, std::vector<std::string>{
                           "warning: CT Network information query failed, could not connect to Telvane"});
}

TEST_F(CellularSnapshotTest, TheStateIsWrittenUnderItsName) {
  answerEverything();
  const TemporaryDirectory directory;
  snapshot.WriteCellularState(directory.path());
  ASSERT_EQ(propertyLists.written.size(), 1U);
  EXPECT_EQ(propertyLists.written[0].first, directory / "CTState.plist");
  EXPECT_EQ(propertyLists.written[0].second.size(), 34U);
}

TEST_F(CellularSnapshotTest, AStateThatCannotBeWrittenIsNoMoreThanAMissingFile) {
  snapshot.WriteCellularState("/nonexistent/directory");
  EXPECT_EQ(propertyLists.written.size(), 1U);
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(CellularSnapshotTest, ABasebandDumpWithoutAReasonNamesItsLabel) {
  snapshot.DumpBasebandState(std::nullopt, "Vistel/Quillet");
  EXPECT_EQ(telephony.basebandDumps, std::vector<std::string>{"Baseband dump for Vistel/Quillet logging"});
  EXPECT_EQ(telephony.open, 0);
  EXPECT_EQ(log.lines, std::vector<std::string>{"notice: Baseband snapshot successful"});
}

TEST_F(CellularSnapshotTest, ABasebandDumpSendsItsReasonAsItIs) {
  snapshot.DumpBasebandState("call dropped", "Vistel/Quillet");
  snapshot.DumpBasebandState("", "Vistel/Quillet");  // an empty reason is a reason
  EXPECT_EQ(telephony.basebandDumps, (std::vector<std::string>{"call dropped", ""}));
}

TEST_F(CellularSnapshotTest, ABasebandDumpWithTheServiceStoppedIsOneLineInTheLog) {
  telephony.reachable = false;
  snapshot.DumpBasebandState("call dropped", "Vistel/Quillet");
  EXPECT_TRUE(telephony.basebandDumps.empty());
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: Baseband snapshot failed, could not connect to Telvane"});
}

}  // namespace
}  // namespace zal::testing
