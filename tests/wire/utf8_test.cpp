#include "platform/linux/wire/utf8.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

constexpr const char* kMark = "\xEF\xBF\xBD";

std::string marks(int count) {
  std::string text;
  for (int i = 0; i < count; ++i) text += kMark;
  return text;
}

TEST(Utf8Test, WellFormedTextOfEveryLengthStaysAsItIs) {
  const std::string text = "plain ascii, long enough for the eight-byte steps; ü € 𝄞 \xF4\x8F\xBF\xBF \x7F";
  EXPECT_TRUE(isUtf8(text));
  EXPECT_EQ(replacedUtf8(text), text);
  EXPECT_TRUE(isUtf8(""));
  EXPECT_TRUE(isUtf8(std::string_view("a\0b", 3)));
}

TEST(Utf8Test, ABadByteAnywhereIsSeen) {
  for (std::size_t size = 1; size <= 75; ++size) {
    EXPECT_TRUE(isUtf8(std::string(size, 'a'))) << size;
    for (std::size_t at = 0; at < size; ++at) {
      std::string text(size, 'a');
      text[at] = '\xFF';
      EXPECT_FALSE(isUtf8(text)) << at << " of " << size;
      EXPECT_EQ(replacedUtf8(text), std::string(at, 'a') + kMark + std::string(size - 1 - at, 'a'));
    }
  }
}

TEST(Utf8Test, AnInterruptedCharacterBecomesOneMark) {
  EXPECT_EQ(replacedUtf8("a\xE2\x82"
                         "b"),
            "a" + marks(1) + "b");
  EXPECT_EQ(replacedUtf8("a\xF0\x9F\x98"), "a" + marks(1));
  EXPECT_EQ(replacedUtf8("\xC3"), marks(1));
}

TEST(Utf8Test, OverlongFormsSurrogatesAndTooLargeOnesBecomeOneMarkAByte) {
  EXPECT_EQ(replacedUtf8("\xC0\x80"), marks(2));
  EXPECT_EQ(replacedUtf8("\xE0\x80\x80"), marks(3));
  EXPECT_EQ(replacedUtf8("\xED\xA0\x80"), marks(3));
  EXPECT_EQ(replacedUtf8("\xF4\x90\x80\x80"), marks(4));
  EXPECT_EQ(replacedUtf8("\xF8\x88\x80\x80\x80"), marks(5));
}

TEST(Utf8Test, TheExampleOfTheUnicodeStandard) {
  EXPECT_EQ(replacedUtf8("\x61\xF1\x80\x80\xE1\x80\xC2\x62\x80\x63\x80\xBF\x64"),
            "a" + marks(3) + "b" + marks(1) + "c" + marks(2) + "d");
}

TEST(Utf8Test, StepsGiveTheCodePoints) {
  EXPECT_EQ(nextUtf8("€").codePoint, U'€');
  EXPECT_EQ(nextUtf8("𝄞").codePoint, U'𝄞');
  EXPECT_EQ(nextUtf8("𝄞").size, 4U);
  EXPECT_FALSE(nextUtf8("\x80").valid);
}

}  // namespace
}  // namespace zal
