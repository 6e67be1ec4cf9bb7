#include "agent/session_type_key.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

using namespace std::string_literals;

TEST(SessionTypeKeyTest, IsTheLastPathComponent) {
  EXPECT_EQ(sessionTypeKey("Vistel"), "Vistel");
  EXPECT_EQ(sessionTypeKey("a/b/Vistel"), "Vistel");
  EXPECT_EQ(sessionTypeKey("/Vistel"), "Vistel");
  EXPECT_EQ(sessionTypeKey("../../Vistel"), "Vistel");
}

TEST(SessionTypeKeyTest, TrailingSlashesDoNotCount) {
  EXPECT_EQ(sessionTypeKey("a/Vistel/"), "Vistel");
  EXPECT_EQ(sessionTypeKey("Vistel///"), "Vistel");
}

TEST(SessionTypeKeyTest, AnAbsentOrEmptyTypeIsCurrent) {
  EXPECT_EQ(sessionTypeKey(std::nullopt), "Current");
  EXPECT_EQ(sessionTypeKey(""), "Current");
}

TEST(SessionTypeKeyTest, WhatWouldNameNoDirectoryOfItsOwnIsCurrent) {
  for (const char* type : {".", "..", "/", "///", "a/..", "../../..", "x/.", "x/./"}) {
    EXPECT_EQ(sessionTypeKey(type), "Current") << type;
  }
}

TEST(SessionTypeKeyTest, NamesThatOnlyLookLikeDotsAreKept) {
  EXPECT_EQ(sessionTypeKey("..."), "...");
  EXPECT_EQ(sessionTypeKey("a/.b"), ".b");
}

TEST(SessionTypeKeyTest, ControlCharactersBecomeUnderscores) {
  EXPECT_EQ(sessionTypeKey("a\nb\tc\x7F"
                           "d\0e"s),
            "a_b_c_d_e");
  EXPECT_EQ(sessionTypeKey("\0"s), "_");
  EXPECT_EQ(sessionTypeKey("..\0"s), ".._");
}

TEST(SessionTypeKeyTest, IsCutAt255BytesBetweenCharacters) {
  const std::string longest(255, 'x');
  EXPECT_EQ(sessionTypeKey(longest), longest);
  EXPECT_EQ(sessionTypeKey(longest + "y"), longest);
  EXPECT_EQ(sessionTypeKey(std::string(254, 'x') + "é"), std::string(254, 'x'));
  EXPECT_EQ(sessionTypeKey(std::string(253, 'x') + "é"), std::string(253, 'x') + "é");
}

TEST(SessionTypeKeyTest, OtherCharactersStayAsTheyAre) {
  EXPECT_EQ(sessionTypeKey("$(touch X) ü 'q'"), "$(touch X) ü 'q'");
}

}  // namespace
}  // namespace zal
