#include "dump/shell_word.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(ShellWordTest, OrdinaryTextStaysAsItIs) {
  EXPECT_EQ(shellWord("Az09@+._:-"), "Az09@+._:-");
  EXPECT_EQ(shellWord("-x"), "-x");
  EXPECT_EQ(shellPath("/var/mobile/Logs-1.2/Reports"), "/var/mobile/Logs-1.2/Reports");
}

TEST(ShellWordTest, EverythingElseIsQuotedAsAWhole) {
  EXPECT_EQ(shellWord("a b"), "'a b'");
  EXPECT_EQ(shellWord("$(touch X)`y`\\;&|<>*?~\""), "'$(touch X)`y`\\;&|<>*?~\"'");
  EXPECT_EQ(shellWord("two\nlines"), "'two\nlines'");
  EXPECT_EQ(shellWord("a/b"), "'a/b'");
  EXPECT_EQ(shellWord("\xC3\xA9"), "'\xC3\xA9'");
  EXPECT_EQ(shellWord(""), "''");
  EXPECT_EQ(shellPath("/a b/c"), "'/a b/c'");
}

TEST(ShellWordTest, AQuoteIsTakenOutOfTheQuotes) {
  EXPECT_EQ(shellWord("it's"), "'it'\\''s'");
  EXPECT_EQ(shellWord("'"), "''\\'''");
}

TEST(ShellWordTest, ANulEndsTheWord) {
  using namespace std::string_view_literals;
  EXPECT_EQ(shellWord("abc\0; rm"sv), "abc");
  EXPECT_EQ(shellWord("a c\0'"sv), "'a c'");
}

}  // namespace
}  // namespace zal
