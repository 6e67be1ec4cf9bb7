#include "platform/linux/files/escaped_text.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(EscapedTextTest, PrintableTextStandsAsItIs) {
  EXPECT_EQ(escapedLine("a b \xc3\xa4 \xf0\x9f\x93\x9e \"'"), "a b \xc3\xa4 \xf0\x9f\x93\x9e \"'");
  EXPECT_EQ(escapedWord("a b"), "a\\x20b");
}

TEST(EscapedTextTest, EverythingElseIsEscapedAndComesBack) {
  EXPECT_EQ(escapedLine("a\nb\\c\x7f\xff\xc2\x85"), "a\\x0ab\\\\c\\x7f\\xff\\xc2\\x85");
  std::string all;
  for (int byte = 0; byte < 256; ++byte) all += static_cast<char>(byte);
  all += "\\x41\\\\";
  EXPECT_EQ(unescaped(escapedLine(all)), all);
  EXPECT_EQ(unescaped(escapedWord(all)), all);
}

TEST(EscapedTextTest, ABackslashThatBeginsNoEscapeStandsForItself) {
  EXPECT_EQ(unescaped("\\"), "\\");
  EXPECT_EQ(unescaped("\\x"), "\\x");
  EXPECT_EQ(unescaped("\\x4"), "\\x4");
  EXPECT_EQ(unescaped("\\xzz\\n"), "\\xzz\\n");
}

TEST(EscapedTextTest, ACutLeavesWholeCharacters) {
  EXPECT_EQ(cutAtCharacter("abc", 3), "abc");
  EXPECT_EQ(cutAtCharacter("abc", 2), "ab");
  EXPECT_EQ(cutAtCharacter("a\xc3\xa4", 2), "a");
  EXPECT_EQ(cutAtCharacter("\xf0\x9f\x93\x9e!", 3), "");
  EXPECT_EQ(cutAtCharacter("\xf0\x9f\x93\x9e!", 4), "\xf0\x9f\x93\x9e");
  EXPECT_EQ(cutAtCharacter("", 0), "");
}

}  // namespace
}  // namespace zal
