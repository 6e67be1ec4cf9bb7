#include "session/text_encoding.h"

#include <gtest/gtest.h>

#include <string>

namespace zal {
namespace {

TEST(TextEncodingTest, CountsUtf16Units) {
  EXPECT_EQ(utf16Length(""), 0U);
  EXPECT_EQ(utf16Length("cafe"), 4U);
  EXPECT_EQ(utf16Length("café"), 4U);
  EXPECT_EQ(utf16Length("€"), 1U);
  EXPECT_EQ(utf16Length("😀"), 2U);
  EXPECT_EQ(utf16Length("twelve ascii 😀 and é then more ascii"), 37U);
  EXPECT_EQ(utf16Length(std::string(1000, 'a') + "é"), 1001U);
}

TEST(TextEncodingTest, CutsAfterUtf16UnitsAndNeverInsideACharacter) {
  EXPECT_EQ(utf16Prefix("", 3), "");
  EXPECT_EQ(utf16Prefix("abcd", 0), "");
  EXPECT_EQ(utf16Prefix("abcd", 3), "abc");
  EXPECT_EQ(utf16Prefix("abcd", 4), "abcd");
  EXPECT_EQ(utf16Prefix("abcd", 9), "abcd");
  EXPECT_EQ(utf16Prefix("é€x", 2), "é€");
  EXPECT_EQ(utf16Prefix("a😀b", 1), "a");
  EXPECT_EQ(utf16Prefix("a😀b", 2), "a");
  EXPECT_EQ(utf16Prefix("a😀b", 3), "a😀");
}

TEST(TextEncodingTest, AcceptsWellFormedText) {
  for (const char* text :
       {"", "plain ascii, longer than one word", "é", "€", "😀", "\uD7FF\uE000\U0010FFFF"}) {
    EXPECT_TRUE(isValidUtf8(text)) << text;
  }
}

TEST(TextEncodingTest, RejectsWhatIsNotWellFormed) {
  for (const char* text :
       {"\x80", "abcdefgh\xFF", "\xC3", "\xC3(", "\xC0\xAF", "\xC1\xBF", "\xE0\x80\xAF", "\xED\xA0\x80",
        "\xF0\x80\x80\xAF", "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xE2\x82"}) {
    EXPECT_FALSE(isValidUtf8(text));
  }
}

TEST(TextEncodingTest, TrimsWhiteSpaceAndLineBreaksAtBothEnds) {
  EXPECT_EQ(trimmed("12:00 \n"), "12:00");
  EXPECT_EQ(trimmed("\r\n\t a  b \v\f"), "a  b");
  EXPECT_EQ(trimmed("\u00A0\u2028 x \u3000\u0085"), "x");
  EXPECT_EQ(trimmed(" \n "), "");
  EXPECT_EQ(trimmed(""), "");
  EXPECT_EQ(trimmed("é"), "é");
}

}  // namespace
}  // namespace zal
