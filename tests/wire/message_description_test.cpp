#include "platform/linux/wire/message_description.h"

#include <gtest/gtest.h>

#include "platform/linux/wire/scalar_blob.h"
#include "tests/wire/payloads.h"

namespace zal {
namespace {

using flexbuffers::Builder;

std::string described(const std::function<void(Builder&)>& fill) {
  const std::string payload = flexMap(fill);
  const auto message = messageOf(payload);
  EXPECT_TRUE(message.has_value());
  return message->description();
}

TEST(MessageDescriptionTest, ShowsEveryTypeOnOneLine) {
  EXPECT_EQ(described([](Builder& b) {
              b.Int("a", -1);
              b.UInt("b", 2);
              b.Double("c", 4.5);
              b.Bool("d", false);
              b.Null("e");
              b.String("f", "tëxt");
              b.Vector("g", [&] {
                b.Int(1);
                b.String("x");
              });
              b.Map("h", [&] { b.Int("in", 3); });
              b.Key("i");
              const ScalarBlob blob(Number(4.5));
              b.Blob(blob.bytes().data(), blob.bytes().size());
              b.Key("j");
              b.Blob("????", 4);
            }),
            R"({"a": -1, "b": 2u, "c": 4.5, "d": false, "e": null, "f": "tëxt", "g": [1, "x"], )"
            R"("h": {"in": 3}, "i": <4.5>, "j": <4 bytes>})");
}

TEST(MessageDescriptionTest, NothingInItCanBreakTheLineOrTurnItsDirection) {
  EXPECT_EQ(described([](Builder& b) {
              b.Key("k\n");
              b.String("a\nb\tc\r\x1b\"\\\x7F\xC2\x85\xE2\x80\xA8\xE2\x80\xAE\xFFz\0", 21);
            }),
            R"({"k\n": "a\nb\tc\u{D}\u{1B}\"\\\u{7F}\u{85}\u{2028}\u{202E}\xFFz\u{0}"})");
}

TEST(MessageDescriptionTest, ALongTextIsCutWithItsWholeSize) {
  EXPECT_EQ(described([](Builder& b) { b.String("t", std::string(5000, 'x')); }),
            "{\"t\": \"" + std::string(1023, 'x') + "\"… (5000 bytes)}");
}

TEST(MessageDescriptionTest, ALongLineIsCutWithANote) {
  const std::string line = described([](Builder& b) {
    b.Vector("v", [&] {
      for (int i = 0; i < 100'000; ++i) b.Int(7);
    });
  });
  EXPECT_LT(line.size(), 8192U + 100U);
  EXPECT_EQ(line.substr(line.size() - 18), ", 7, 7]} … (cut)");
}

}  // namespace
}  // namespace zal
