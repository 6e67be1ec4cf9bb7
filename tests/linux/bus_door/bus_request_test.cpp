#include "platform/linux/bus/door/bus_request.h"

#include <gmock/gmock.h>

#include <limits>

#include "tests/linux/bus_door/door_fixture.h"

namespace zal::testing {
namespace {

class BusRequestTest : public DoorFixture {
 protected:
  /// What the look at the request finds when somebody really sends it.
  template <class T>
  T read(const sdbus::Variant& value, const std::function<T(const Message&)>& look) {
    T found{};
    onMessage = [&](const Message& message) { found = look(message); };
    BusVisitor visitor(bus.address());
    EXPECT_EQ(resultOf(visitor.call({{"k", value}})).error, "");
    return found;
  }
  std::int64_t int64(const sdbus::Variant& value) {
    return read<std::int64_t>(value, [](const Message& m) { return m.int64("k"); });
  }
  std::uint64_t uint64(const sdbus::Variant& value) {
    return read<std::uint64_t>(value, [](const Message& m) { return m.uint64("k"); });
  }
  double real(const sdbus::Variant& value) {
    return read<double>(value, [](const Message& m) { return m.real("k"); });
  }
  std::string string(const sdbus::Variant& value) {
    return read<std::string>(value,
                             [](const Message& m) { return std::string(m.string("k").value_or("none")); });
  }
  std::optional<Number> number(const sdbus::Variant& value) {
    return read<std::optional<Number>>(value, [](const Message& m) { return m.codedNumber("k"); });
  }
  std::optional<ValueMap> dictionary(const sdbus::Variant& value) {
    return read<std::optional<ValueMap>>(value, [](const Message& m) { return m.dictionary("k"); });
  }
};

constexpr auto kLargest = std::numeric_limits<std::uint64_t>::max();

TEST_F(BusRequestTest, WholeNumbersOfAnyWidthDoWhereTheyFit) {
  open();
  EXPECT_EQ(int64(sdbus::Variant(std::int64_t{-7})), -7);
  EXPECT_EQ(int64(sdbus::Variant(std::int32_t{-7})), -7);
  EXPECT_EQ(int64(sdbus::Variant(std::int16_t{-7})), -7);
  EXPECT_EQ(int64(sdbus::Variant(std::uint8_t{7})), 7);
  EXPECT_EQ(int64(sdbus::Variant(std::uint32_t{7})), 7);
  EXPECT_EQ(int64(sdbus::Variant(kLargest)), 0);
  EXPECT_EQ(uint64(sdbus::Variant(kLargest)), kLargest);
  EXPECT_EQ(uint64(sdbus::Variant(std::uint16_t{7})), 7U);
  EXPECT_EQ(uint64(sdbus::Variant(std::int32_t{7})), 7U);
  EXPECT_EQ(uint64(sdbus::Variant(std::int32_t{-7})), 0U);
}

TEST_F(BusRequestTest, NothingElseIsConverted) {
  open();
  EXPECT_EQ(int64(sdbus::Variant(7.0)), 0);
  EXPECT_EQ(int64(sdbus::Variant(std::string("7"))), 0);
  EXPECT_EQ(int64(sdbus::Variant(true)), 0);
  EXPECT_EQ(real(sdbus::Variant(100.5)), 100.5);
  EXPECT_EQ(real(sdbus::Variant(std::int32_t{100})), 0.0);
  EXPECT_EQ(string(sdbus::Variant(std::int32_t{100})), "none");
  EXPECT_EQ(dictionary(sdbus::Variant(std::string("a"))), std::nullopt);
}

TEST_F(BusRequestTest, TextsAreTextsWhateverTheBusCallsThem) {
  open();
  EXPECT_EQ(string(sdbus::Variant(std::string("a \xC3\xA9"))), "a \xC3\xA9");
  EXPECT_EQ(string(sdbus::Variant(sdbus::ObjectPath("/a/b"))), "/a/b");
  EXPECT_EQ(string(sdbus::Variant(sdbus::Signature("a{sv}"))), "a{sv}");
}

TEST_F(BusRequestTest, ANumberKeepsItsKindAndMayStandInAVariantOfItsOwn) {
  open();
  EXPECT_EQ(number(sdbus::Variant(4.5)), Number(4.5));
  EXPECT_EQ(number(sdbus::Variant(std::int32_t{-3})), Number(std::int64_t{-3}));
  EXPECT_EQ(number(sdbus::Variant(std::uint32_t{3})), Number(std::uint64_t{3}));
  EXPECT_EQ(number(sdbus::Variant(true)), Number(true));
  EXPECT_EQ(number(sdbus::Variant(sdbus::Variant(4.5))), Number(4.5));
  EXPECT_EQ(number(sdbus::Variant(std::string("4.5"))), std::nullopt);
}

TEST_F(BusRequestTest, DictionariesHoldEverythingThatTheBusCanWrite) {
  open();
  const Dictionary sent{{"b", sdbus::Variant(true)},
                        {"d", sdbus::Variant(Dictionary{{"x", sdbus::Variant(std::uint64_t{5})}})},
                        {"l", sdbus::Variant(std::vector<std::string>{"a", "b"})},
                        {"r", sdbus::Variant(sdbus::Struct<std::int32_t, std::string>(1, "s"))},
                        {"odd", sdbus::Variant(std::map<std::int32_t, std::string>{{1, "one"}})},
                        {"texts", sdbus::Variant(std::map<std::string, std::string>{{"k", "v"}})},
                        {"void", sdbus::Variant(std::vector<std::string>{})},
                        {"fd", sdbus::Variant(sdbus::UnixFd(0))}};
  const ValueMap expected{{"b", true},
                          {"d", ValueMap{{"x", std::uint64_t{5}}}},
                          {"l", ValueList{std::string("a"), std::string("b")}},
                          {"r", ValueList{std::int64_t{1}, std::string("s")}},
                          {"odd", nullptr},
                          {"texts", ValueMap{{"k", std::string("v")}}},
                          {"void", ValueList{}},
                          {"fd", nullptr}};
  EXPECT_EQ(dictionary(sdbus::Variant(sent)), expected);
}

TEST_F(BusRequestTest, EveryKindOfValueGoesOutInAReply) {
  open();
  keepsPeers = true;
  BusVisitor visitor(bus.address());
  auto answer = visitor.call({});
  ASSERT_TRUE(runUntil([this] { return events.size() == 1; }));
  events[0].peer->sendReply(*events[0].token, {{"b", true},
                                               {"i", std::int64_t{-1}},
                                               {"u", std::uint64_t{1}},
                                               {"d", 0.5},
                                               {"null", nullptr},
                                               {"s", std::string("a\xFF")},
                                               {"l", ValueList{std::int64_t{1}, nullptr, std::string("x")}}});
  const Dictionary reply = resultOf(std::move(answer)).reply;
  ASSERT_EQ(reply.size(), 6U);
  EXPECT_TRUE(reply.at("b").get<bool>());
  EXPECT_EQ(reply.at("i").get<std::int64_t>(), -1);
  EXPECT_EQ(reply.at("u").get<std::uint64_t>(), 1U);
  EXPECT_EQ(reply.at("d").get<double>(), 0.5);
  EXPECT_EQ(reply.at("s").get<std::string>(), "a\xEF\xBF\xBD");
  EXPECT_EQ(reply.at("l").get<std::vector<sdbus::Variant>>().size(), 2U);
}

}  // namespace
}  // namespace zal::testing
