#include "platform/linux/wire/wire_message.h"

#include <gtest/gtest.h>

#include "platform/linux/wire/message_builder.h"
#include "platform/linux/wire/scalar_blob.h"
#include "tests/wire/payloads.h"

namespace zal {
namespace {

using flexbuffers::Builder;

class WireMessageTest : public ::testing::Test {
 protected:
  /// Kept by the fixture, as the message only views it.
  const WireMessage& messageWith(const std::function<void(Builder&)>& fill) {
    _payload = flexMap(fill);
    _message = messageOf(_payload);
    EXPECT_TRUE(_message.has_value());
    return *_message;
  }
  const std::string& payload() const { return _payload; }

 private:
  std::string _payload;
  std::optional<WireMessage> _message;
};

void addBlob(Builder& builder, const char* key, std::string_view bytes) {
  builder.Key(key);
  builder.Blob(bytes.data(), bytes.size());
}

TEST_F(WireMessageTest, ReadsEveryTypeThatItsBuilderWrites) {
  MessageBuilder builder;
  builder.setString("text", "words");
  builder.setInt64("int", -5);
  builder.setUInt64("uint", 18446744073709551615U);
  builder.setReal("real", 100.25);
  builder.setDictionary("map", {{"k", Value(std::string("v"))}});
  builder.setCodedNumber("number", std::int64_t{-3});
  std::string bytes;
  builder.finish(bytes, FrameKind::messageExpectingReply, 77);
  FrameDecoder decoder;
  decoder.feed(bytes);
  const auto message = WireMessage::fromFrame(*decoder.next());
  ASSERT_TRUE(message.has_value());
  EXPECT_EQ(message->string("text"), "words");
  EXPECT_EQ(message->int64("int"), -5);
  EXPECT_EQ(message->uint64("uint"), 18446744073709551615U);
  EXPECT_EQ(message->real("real"), 100.25);
  EXPECT_EQ(message->dictionary("map"), (ValueMap{{"k", Value(std::string("v"))}}));
  EXPECT_EQ(message->codedNumber("number"), Number(std::int64_t{-3}));
  EXPECT_EQ(message->replyToken(), 77U);
}

TEST_F(WireMessageTest, KeysAreFoundInWhateverOrderSomebodyAsksForThem) {
  const std::vector<std::string> keys{"", "a", "ab", "b", "category", "type", "typed"};
  const auto& message = messageWith([&](Builder& builder) {
    for (std::size_t i = 0; i < keys.size(); ++i)
      builder.Int(keys[i].c_str(), static_cast<std::int64_t>(i) + 1);
  });
  for (std::size_t first = 0; first < keys.size(); ++first) {
    for (std::size_t second = 0; second < keys.size(); ++second) {
      for (const char* absent : {"aa", "zz", "categor", "typedd"}) {
        EXPECT_EQ(message.int64(keys[first]), static_cast<std::int64_t>(first) + 1);
        EXPECT_EQ(message.int64(absent), 0);
        EXPECT_EQ(message.int64(keys[second]), static_cast<std::int64_t>(second) + 1);
      }
    }
  }
  EXPECT_EQ(message.int64(std::string_view("a\0", 2)), 0);
}

TEST_F(WireMessageTest, AKeyThatStandsTwiceIsTheSameEachTimeItIsAskedFor) {
  std::string payload = flexMap([](Builder& builder) {
    builder.Int("a", 1);
    builder.Double("b", 0.5);
  });
  payload[payload.find('b')] = 'a';
  const auto message = messageOf(payload);
  ASSERT_TRUE(message.has_value());
  EXPECT_EQ((message->int64("a") != 0 ? 1 : 0) + (message->real("a") != 0 ? 1 : 0), 1);
}

TEST_F(WireMessageTest, AMissingValueReadsAsItsDefault) {
  const auto& message = messageWith([](Builder&) {});
  EXPECT_EQ(message.string("x"), std::nullopt);
  EXPECT_EQ(message.int64("x"), 0);
  EXPECT_EQ(message.uint64("x"), 0U);
  EXPECT_EQ(message.real("x"), 0.0);
  EXPECT_EQ(message.dictionary("x"), std::nullopt);
  EXPECT_EQ(message.codedNumber("x"), std::nullopt);
  EXPECT_EQ(message.replyToken(), std::nullopt);
}

TEST_F(WireMessageTest, AValueOfAnotherTypeReadsAsAbsent) {
  const auto& message = messageWith([](Builder& b) {
    b.String("text", "15");
    b.Int("int", 15);
    b.UInt("uint", 15);
    b.Double("real", 15.0);
    b.Bool("bool", true);
    b.Map("map", [&] { b.Int("a", 15); });
    addBlob(b, "blob", ScalarBlob(std::int64_t{15}).bytes());
  });
  for (const char* key : {"text", "int", "uint", "real", "bool", "map", "blob"}) {
    const std::string name = key;
    EXPECT_EQ(message.string(key).has_value(), name == "text") << key;
    EXPECT_EQ(message.int64(key) != 0, name == "int") << key;
    EXPECT_EQ(message.uint64(key) != 0, name == "uint") << key;
    EXPECT_EQ(message.real(key) != 0.0, name == "real") << key;
    EXPECT_EQ(message.dictionary(key).has_value(), name == "map") << key;
    EXPECT_EQ(message.codedNumber(key).has_value(), name == "blob") << key;
  }
}

TEST_F(WireMessageTest, IndirectNumbersAreTheSameTypesAsDirectOnes) {
  const auto& message = messageWith([](Builder& b) {
    b.IndirectInt("int", -9);
    b.IndirectUInt("uint", 9);
    b.IndirectDouble("real", 0.1);
    b.IndirectFloat("short", 0.5F);
  });
  EXPECT_EQ(message.int64("int"), -9);
  EXPECT_EQ(message.uint64("uint"), 9U);
  EXPECT_EQ(message.real("real"), 0.1);
  EXPECT_EQ(message.real("short"), 0.5);
}

TEST_F(WireMessageTest, TextIsAViewIntoThePayload) {
  const auto& message = messageWith([](Builder& b) { b.String("text", "not copied, ü"); });
  const auto text = message.string("text");
  ASSERT_TRUE(text.has_value());
  EXPECT_GE(text->data(), payload().data());
  EXPECT_LT(text->data(), payload().data() + payload().size());
}

TEST_F(WireMessageTest, InvalidUtf8IsReplacedAndStaysReadable) {
  const auto& message = messageWith([](Builder& b) {
    b.String("a", "x\xFFy");
    b.String("b", "\xE2\x82");
  });
  const auto first = message.string("a");
  const auto second = message.string("b");
  EXPECT_EQ(first, "x\xEF\xBF\xBDy");
  EXPECT_EQ(second, "\xEF\xBF\xBD");
}

TEST_F(WireMessageTest, ZeroBytesInTextAreKept) {
  const auto& message = messageWith([](Builder& b) {
    b.Key("text");
    b.String("a\0b", 3);
  });
  EXPECT_EQ(message.string("text"), std::string_view("a\0b", 3));
}

TEST_F(WireMessageTest, ACodedValueKeepsItsKindOfNumber) {
  const auto& message = messageWith([](Builder& b) {
    addBlob(b, "int", ScalarBlob(std::int64_t{-1}).bytes());
    addBlob(b, "uint", ScalarBlob(std::uint64_t{1} << 63U).bytes());
    addBlob(b, "real", ScalarBlob(4.5).bytes());
    addBlob(b, "bool", ScalarBlob(true).bytes());
  });
  EXPECT_EQ(message.codedNumber("int"), Number(std::int64_t{-1}));
  EXPECT_EQ(message.codedNumber("uint"), Number(std::uint64_t{1} << 63U));
  EXPECT_EQ(message.codedNumber("real"), Number(4.5));
  EXPECT_EQ(message.codedNumber("bool"), Number(true));
}

TEST_F(WireMessageTest, ACodedValueThatIsNoNumberReadsAsAbsent) {
  Builder text;
  text.String("15");
  text.Finish();
  Builder null;
  null.Null();
  null.Finish();
  const auto& message = messageWith([&](Builder& b) {
    addBlob(b, "text", {reinterpret_cast<const char*>(text.GetBuffer().data()), text.GetSize()});
    addBlob(b, "null", {reinterpret_cast<const char*>(null.GetBuffer().data()), null.GetSize()});
    addBlob(b, "map", flexMap([](Builder& inner) { inner.Int("a", 1); }));
    addBlob(b, "noise", "\xFF\xFF\xFF\xFF\xFF");
    addBlob(b, "empty", "");
  });
  for (const char* key : {"text", "null", "map", "noise", "empty"}) {
    EXPECT_EQ(message.codedNumber(key), std::nullopt) << key;
  }
}

TEST_F(WireMessageTest, ADictionaryBecomesPlainValues) {
  const auto& message = messageWith([](Builder& b) {
    b.Map("info", [&] {
      b.Null("null");
      b.Bool("yes", true);
      b.Int("int", -1);
      b.UInt("uint", 1);
      b.Double("real", 1.5);
      b.String("text", "t\xFF");
      b.Vector("list", [&] {
        b.Int(1);
        b.String("two");
      });
      b.TypedVector("ints", [&] {
        b.Int(1);
        b.Int(-300);
      });
      const double pair[] = {0.5, 0.25};
      b.Key("pair");
      b.FixedTypedVector(pair, 2);
      b.Map("inner", [&] { b.Int("deep", 3); });
      addBlob(b, "coded", ScalarBlob(2.5).bytes());
      addBlob(b, "noise", "????");
    });
  });
  const ValueMap expected{{"null", Value()},
                          {"yes", Value(true)},
                          {"int", Value(std::int64_t{-1})},
                          {"uint", Value(std::uint64_t{1})},
                          {"real", Value(1.5)},
                          {"text", Value(std::string("t\xEF\xBF\xBD"))},
                          {"list", Value(ValueList{Value(std::int64_t{1}), Value(std::string("two"))})},
                          {"ints", Value(ValueList{Value(std::int64_t{1}), Value(std::int64_t{-300})})},
                          {"pair", Value(ValueList{Value(0.5), Value(0.25)})},
                          {"inner", Value(ValueMap{{"deep", Value(std::int64_t{3})}})},
                          {"coded", Value(2.5)}};
  EXPECT_EQ(message.dictionary("info"), expected);
}

TEST_F(WireMessageTest, ADictionaryWithTooManyValuesReadsAsAbsent) {
  const auto fill = [](int count) {
    return [count](Builder& b) {
      b.Map("info", [&] {
        b.Vector("list", [&] {
          for (int i = 0; i < count; ++i) b.Int(i);
        });
      });
    };
  };
  EXPECT_TRUE(messageWith(fill(65'535)).dictionary("info").has_value());
  EXPECT_FALSE(messageWith(fill(65'536)).dictionary("info").has_value());
}

TEST_F(WireMessageTest, ADictionaryThatSharesOneTextTooOftenReadsAsAbsent) {
  const std::string text(1U << 20U, 'x');
  const auto fill = [&text](int count) {
    return [&text, count](Builder& b) {
      b.Map("info", [&] {
        b.Key("list");
        const std::size_t list = b.StartVector();
        b.String(text);
        const auto shared = b.LastValue();
        for (int i = 1; i < count; ++i) b.ReuseValue(shared);
        b.EndVector(list, false, false);
      });
    };
  };
  EXPECT_TRUE(messageWith(fill(15)).dictionary("info").has_value());
  EXPECT_FALSE(messageWith(fill(17)).dictionary("info").has_value());
}

TEST_F(WireMessageTest, ARootThatIsNoMapIsRefused) {
  Builder builder;
  builder.Vector([&] { builder.Int(1); });
  builder.Finish();
  EXPECT_FALSE(messageOf({builder.GetBuffer().begin(), builder.GetBuffer().end()}).has_value());
  EXPECT_FALSE(messageOf("").has_value());
  EXPECT_FALSE(messageOf("no flexbuffer at all").has_value());
}

}  // namespace
}  // namespace zal
