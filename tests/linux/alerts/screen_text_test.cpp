#include "platform/linux/alerts/screen_text.h"

#include <gtest/gtest.h>

#include "platform/linux/wire/utf8.h"

namespace zal {
namespace {

TEST(ScreenTextTest, OrdinaryTextStaysAsItIs) {
  EXPECT_EQ(screenLine("Vistel Logging \xC3\xA4 \xF0\x9F\x93\x9E <b>&amp; --x", 80),
            "Vistel Logging \xC3\xA4 \xF0\x9F\x93\x9E <b>&amp; --x");
  EXPECT_EQ(screenText("one\ntwo", 80), "one\ntwo");
}

TEST(ScreenTextTest, WhatActsOnAScreenBecomesABlank) {
  EXPECT_EQ(screenLine(std::string("a\0b\x1b[2J\r\n\tc\x7f\xC2\x85 d", 16), 80), "a b [2J   c   d");
  EXPECT_EQ(screenText("a\x01\nb\r", 80), "a \nb ");
  // What turns the direction: "fdp.exe" must not read as "exe.pdf".
  EXPECT_EQ(screenLine("\xE2\x80\xAE"
                       "fdp.exe\xE2\x81\xA6",
                       80),
            " fdp.exe ");
}

TEST(ScreenTextTest, WhatIsTooLongEndsInAnEllipsisAfterAWholeCharacter) {
  EXPECT_EQ(screenLine("abc", 3), "abc");
  EXPECT_EQ(screenLine("abcd", 3), "abc\xE2\x80\xA6");
  EXPECT_EQ(screenText("\xC3\xA4\xC3\xA4\xC3\xA4", 2), "\xC3\xA4\xC3\xA4\xE2\x80\xA6");
}

TEST(FoldedTextTest, LinesAreBrokenAtBlanksElseAnywhere) {
  EXPECT_EQ(foldedText("stored in this file", 10, 9), "stored in\nthis file");
  EXPECT_EQ(foldedText("abcdefghijkl", 5, 9), "abcde\nfghij\nkl");
  EXPECT_EQ(foldedText("\xC3\xA4\xC3\xA4\xC3\xA4", 2, 9), "\xC3\xA4\xC3\xA4\n\xC3\xA4");
  EXPECT_EQ(foldedText("one\n\ntwo", 10, 9), "one\n\ntwo");
  EXPECT_EQ(foldedText("", 10, 9), "");
}

TEST(FoldedTextTest, NoMoreLinesThanFit) {
  EXPECT_EQ(foldedText("a\nb\nc", 10, 3), "a\nb\nc");
  EXPECT_EQ(foldedText("a\nb\nc\nd", 10, 3), "a\nb\nc\xE2\x80\xA6");
  EXPECT_TRUE(isUtf8(foldedText(std::string(4096, '\n'), 40, 12)));
}

}  // namespace
}  // namespace zal
