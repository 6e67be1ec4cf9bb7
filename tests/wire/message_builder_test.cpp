#include "platform/linux/wire/message_builder.h"

#include <limits>

#include <flatbuffers/flexbuffers.h>
#include <gtest/gtest.h>

#include "platform/linux/wire/frame_decoder.h"

namespace zal {
namespace {

class MessageBuilderTest : public ::testing::Test {
 protected:
  /// The root map as the format's own library reads it, after its own verification.
  flexbuffers::Map built(FrameKind kind = FrameKind::message, std::uint64_t cookie = 0) {
    _bytes.clear();
    const std::size_t size = builder.finish(_bytes, kind, cookie);
    EXPECT_EQ(size, _bytes.size());
    FrameDecoder decoder;
    decoder.feed(_bytes);
    const auto frame = decoder.next();
    EXPECT_TRUE(frame.has_value()) << decoder.failure();
    EXPECT_EQ(frame->header.kind, kind);
    EXPECT_EQ(frame->header.cookie, cookie);
    _payload.assign(frame->payload.begin(), frame->payload.end());
    EXPECT_TRUE(flexbuffers::VerifyBuffer(_payload.data(), _payload.size()));
    const auto root = flexbuffers::GetRoot(_payload);
    EXPECT_TRUE(root.IsMap());
    return root.AsMap();
  }

  MessageBuilder builder;

 private:
  std::string _bytes;
  std::vector<std::uint8_t> _payload;
};

TEST_F(MessageBuilderTest, AMessageWithoutKeysIsAnEmptyMap) { EXPECT_EQ(built().size(), 0U); }

TEST_F(MessageBuilderTest, EveryTypeReadsBackWithTheFormatsOwnLibrary) {
  builder.setString("text", "héllo");
  builder.setInt64("int", -7);
  builder.setUInt64("uint", 7);
  builder.setReal("real", 0.1);
  builder.setDictionary("map", {{"a", Value(std::int64_t{1})}, {"b", Value(std::string("x"))}});
  builder.setCodedNumber("coded", 4.5);
  const auto map = built(FrameKind::messageExpectingReply, 99);
  ASSERT_EQ(map.size(), 6U);
  EXPECT_EQ(map["text"].GetType(), flexbuffers::FBT_STRING);
  EXPECT_EQ(map["text"].AsString().str(), "héllo");
  EXPECT_EQ(map["int"].GetType(), flexbuffers::FBT_INT);
  EXPECT_EQ(map["int"].AsInt64(), -7);
  EXPECT_EQ(map["uint"].GetType(), flexbuffers::FBT_UINT);
  EXPECT_EQ(map["uint"].AsUInt64(), 7U);
  EXPECT_EQ(map["real"].GetType(), flexbuffers::FBT_FLOAT);
  EXPECT_EQ(map["real"].AsDouble(), 0.1);
  EXPECT_EQ(map["map"].AsMap()["a"].AsInt64(), 1);
  EXPECT_EQ(map["map"].AsMap()["b"].AsString().str(), "x");
  const auto blob = map["coded"].AsBlob();
  ASSERT_TRUE(flexbuffers::VerifyBuffer(blob.data(), blob.size()));
  EXPECT_EQ(flexbuffers::GetRoot(blob.data(), blob.size()).GetType(), flexbuffers::FBT_FLOAT);
  EXPECT_EQ(flexbuffers::GetRoot(blob.data(), blob.size()).AsDouble(), 4.5);
}

TEST_F(MessageBuilderTest, EdgesOfEveryIntegerWidthSurvive) {
  for (const std::int64_t value :
       {std::int64_t{0}, std::int64_t{127}, std::int64_t{128}, std::int64_t{-128}, std::int64_t{-129},
        std::int64_t{32767}, std::int64_t{32768}, std::int64_t{-32769}, std::int64_t{2147483647},
        std::int64_t{2147483648}, std::numeric_limits<std::int64_t>::min(),
        std::numeric_limits<std::int64_t>::max()}) {
    builder.setInt64("i", value);
    builder.setUInt64("u", static_cast<std::uint64_t>(value));
    builder.setString("s", "beside");
    const auto map = built();
    EXPECT_EQ(map["i"].AsInt64(), value);
    EXPECT_EQ(map["u"].AsUInt64(), static_cast<std::uint64_t>(value));
    EXPECT_EQ(map["s"].AsString().str(), "beside");
  }
}

TEST_F(MessageBuilderTest, TextsOfEveryLengthWidthSurviveBesideShortOnes) {
  for (const std::size_t size :
       {0U, 1U, 100U, 180U, 220U, 254U, 255U, 256U, 257U, 65535U, 65536U, 1000000U}) {
    const std::string text(size, 'x');
    builder.setString("first", "one");
    builder.setString("long", text);
    builder.setString("another", "two");
    const auto map = built();
    EXPECT_EQ(map["first"].AsString().str(), "one");
    EXPECT_EQ(map["long"].AsString().str(), text) << size;
    EXPECT_EQ(map["another"].AsString().str(), "two");
  }
}

TEST_F(MessageBuilderTest, ZeroBytesInsideATextAreKept) {
  builder.setString("text", std::string_view("a\0b", 3));
  EXPECT_EQ(built()["text"].AsString().str(), std::string("a\0b", 3));
}

TEST_F(MessageBuilderTest, KeysMayBeSetInAnyOrderAndAreFoundAgain) {
  const std::vector<std::string> keys{"type", "sender", "__ipc__event_code__", "time", "level", "a", "zz"};
  for (const auto& key : keys) builder.setString(key, key + "!");
  const auto map = built();
  for (const auto& key : keys) EXPECT_EQ(map[key].AsString().str(), key + "!");
}

TEST_F(MessageBuilderTest, ManyLongKeysWidenTheTableOfKeys) {
  std::vector<std::string> keys;
  for (int i = 0; i < 60; ++i) keys.push_back(std::to_string(i) + std::string(2000, 'k'));
  for (const auto& key : keys) builder.setInt64(key, static_cast<std::int64_t>(key.size()));
  const auto map = built();
  for (const auto& key : keys) EXPECT_EQ(map[key].AsInt64(), static_cast<std::int64_t>(key.size()));
}

TEST_F(MessageBuilderTest, NestedDictionariesMoveIntoTheMessageWhole) {
  const ValueMap inner{{"deep", Value(std::string(300, 'd'))},
                       {"list", Value(ValueList{Value(1.5), Value(true)})}};
  builder.setString("before", "odd");
  builder.setDictionary("userInfo", {{"inner", Value(inner)}, {"none", Value()}});
  builder.setString("after", "even");
  const auto map = built();
  const auto info = map["userInfo"].AsMap();
  EXPECT_EQ(info["inner"].AsMap()["deep"].AsString().str(), std::string(300, 'd'));
  EXPECT_EQ(info["inner"].AsMap()["list"].AsVector()[0].AsDouble(), 1.5);
  EXPECT_TRUE(info["none"].IsNull());
  EXPECT_EQ(map["before"].AsString().str(), "odd");
  EXPECT_EQ(map["after"].AsString().str(), "even");
}

TEST_F(MessageBuilderTest, FinishEmptiesItForTheNextMessage) {
  builder.setInt64("a", 1);
  EXPECT_EQ(built().size(), 1U);
  builder.setInt64("b", 2);
  const auto map = built();
  EXPECT_EQ(map.size(), 1U);
  EXPECT_EQ(map["b"].AsInt64(), 2);
}

TEST_F(MessageBuilderTest, ResetForgetsWhatWasSet) {
  builder.setString("a", "x");
  builder.reset();
  EXPECT_EQ(built().size(), 0U);
}

TEST(EncodeDictionaryTest, IsARootMapOfItsOwn) {
  const std::string bytes = encodeDictionary(
      {{"action", Value(std::int64_t{14})},
       {"replyResult",
        Value(ValueMap{{"logPath", Value(std::string("/d"))}, {"replyAction", Value(std::int64_t{14})}})}});
  const auto* data = reinterpret_cast<const std::uint8_t*>(bytes.data());
  ASSERT_TRUE(flexbuffers::VerifyBuffer(data, bytes.size()));
  const auto map = flexbuffers::GetRoot(data, bytes.size()).AsMap();
  EXPECT_EQ(map["action"].AsInt64(), 14);
  EXPECT_EQ(map["replyResult"].AsMap()["logPath"].AsString().str(), "/d");
  EXPECT_EQ(map["replyResult"].AsMap()["replyAction"].AsInt64(), 14);
}

TEST(EncodeDictionaryTest, AKeyEndsAtItsFirstZeroByte) {
  const std::string bytes = encodeDictionary(
      {{std::string("a"), Value(std::int64_t{1})}, {std::string("a\0b", 3), Value(std::int64_t{2})}});
  const auto* data = reinterpret_cast<const std::uint8_t*>(bytes.data());
  const auto map = flexbuffers::GetRoot(data, bytes.size()).AsMap();
  EXPECT_EQ(map.size(), 1U);
  EXPECT_EQ(map["a"].AsInt64(), 1);
}

}  // namespace
}  // namespace zal
