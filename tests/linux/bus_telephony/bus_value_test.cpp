#include "platform/linux/bus/bus_value.h"

#include <gtest/gtest.h>

#include <tuple>

#include "platform/linux/bus/private_bus.h"
#include "tests/linux/bus_telephony/played_modem_manager.h"

namespace zal::testing {
namespace {

class BusValueTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (const std::string obstacle = PrivateBus::obstacle(); !obstacle.empty()) GTEST_SKIP() << obstacle;
  }
  /// What is read of an answer that carries the values.
  template <class... Values>
  ValueList readBack(const Values&... values) {
    const PrivateBus bus;
    PlayedService service(bus, "com.example.Teller", "/");
    const auto teller = service.object("/teller");
    teller->answers("com.example.Teller", "Tell", [=] { return std::tuple(values...); });
    teller->publish();
    const auto connection = openPrivateBus(bus.address());
    const auto proxy = sdbus::createProxy(*connection, "com.example.Teller", "/teller");
    auto reply = proxy->callMethod(proxy->createMethodCall("com.example.Teller", "Tell"), kAnswerLimit);
    return readValues(reply);
  }
};

TEST_F(BusValueTest, NumbersKeepTheirSign) {
  EXPECT_EQ(readBack(std::uint8_t{200}, std::uint16_t{65535}, std::uint32_t{4294967295},
                     std::uint64_t{18446744073709551615U}),
            (ValueList{std::uint64_t{200}, std::uint64_t{65535}, std::uint64_t{4294967295},
                       std::uint64_t{18446744073709551615U}}));
  EXPECT_EQ(readBack(std::int16_t{-1}, std::int32_t{-2}, std::int64_t{-3}),
            (ValueList{std::int64_t{-1}, std::int64_t{-2}, std::int64_t{-3}}));
  EXPECT_EQ(readBack(true, 1.5), (ValueList{true, 1.5}));
}

TEST_F(BusValueTest, TextsAreTextsWhateverTheyName) {
  EXPECT_EQ(readBack(std::string("text"), sdbus::ObjectPath("/a/b"), sdbus::Signature("a{sv}")),
            (ValueList{"text", "/a/b", "a{sv}"}));
}

TEST_F(BusValueTest, ListsAndStructuresAreLists) {
  EXPECT_EQ(readBack(std::vector<std::uint32_t>{1, 2}, std::vector<std::string>{}),
            (ValueList{ValueList{std::uint64_t{1}, std::uint64_t{2}}, ValueList{}}));
  EXPECT_EQ(readBack(sdbus::Struct<std::uint32_t, bool>{80U, true}),
            ValueList(1, ValueList{std::uint64_t{80}, true}));
}

TEST_F(BusValueTest, DictionariesAreMapsWithTheirKeysAsText) {
  EXPECT_EQ(readBack(std::map<std::string, sdbus::Variant>{{"a", sdbus::Variant(1.5)},
                                                           {"b", sdbus::Variant(std::string("x"))}}),
            (ValueList{ValueMap{{"a", 1.5}, {"b", "x"}}}));
  EXPECT_EQ(readBack(std::map<std::uint32_t, std::string>{{7, "x"}}), (ValueList{ValueMap{{"7", "x"}}}));
  EXPECT_EQ(readBack(std::map<std::int32_t, std::string>{{-7, "x"}}), (ValueList{ValueMap{{"-7", "x"}}}));
  EXPECT_EQ(readBack(std::map<std::string, std::string>{}), (ValueList{ValueMap{}}));
}

TEST_F(BusValueTest, ManagedObjectsAreMapsOfMaps) {
  using Properties = std::map<std::string, sdbus::Variant>;
  using Objects = std::map<sdbus::ObjectPath, std::map<std::string, Properties>>;
  const Properties properties{{"Quality", sdbus::Variant(sdbus::Struct<std::uint32_t, bool>{80U, true})}};
  EXPECT_EQ(readBack(Objects{{sdbus::ObjectPath("/modem"), {{"com.example.Modem", properties}}}}),
            (ValueList{ValueMap{
                {"/modem", ValueMap{{"com.example.Modem",
                                     ValueMap{{"Quality", ValueList{std::uint64_t{80}, true}}}}}}}}));
}

TEST_F(BusValueTest, VariantsAreWhatIsInThem) {
  EXPECT_EQ(readBack(sdbus::Variant(sdbus::Variant(std::string("deep")))), ValueList{"deep"});
}

TEST_F(BusValueTest, ADescriptorIsNullAndWhatFollowsIsRead) {
  EXPECT_EQ(readBack(sdbus::UnixFd(0), std::string("after")), (ValueList{Value(), "after"}));
}

TEST_F(BusValueTest, AnEmptyMessageHasNoValues) { EXPECT_EQ(readBack(), ValueList{}); }

}  // namespace
}  // namespace zal::testing
