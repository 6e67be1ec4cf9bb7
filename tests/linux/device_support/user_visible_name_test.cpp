#include "platform/linux/device_support/user_visible_name.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

TEST(UserVisibleNameTest, ThePrettyHostNameGoesBeforeTheHostName) {
  EXPECT_EQ(userVisibleName("CHASSIS=handset\nPRETTY_HOSTNAME=\"Kim's \\\"phone\\\" \\$1\"\n", "phone"),
            "Kim's \"phone\" $1");
  EXPECT_EQ(userVisibleName("PRETTY_HOSTNAME='Kim'\n", "phone"), "Kim");
}

TEST(UserVisibleNameTest, WithoutOneItIsTheHostName) {
  for (const char* const text :
       {"", "CHASSIS=handset\n", "PRETTY_HOSTNAME=\n", "PRETTY_HOSTNAME=\" \x01 \"\n",
        "# PRETTY_HOSTNAME=Kim\n", "no assignment"}) {
    EXPECT_EQ(userVisibleName(text, "phone"), "phone") << text;
  }
  EXPECT_EQ(userVisibleName("", ""), "");
}

TEST(UserVisibleNameTest, ItIsOneLineOfUtf8) {
  EXPECT_EQ(userVisibleName("PRETTY_HOSTNAME=\"Zo\xC3\xAB\"\n", ""), "Zo\xC3\xAB");
  EXPECT_EQ(userVisibleName("PRETTY_HOSTNAME=\"Zo\xEB!\"\n", ""), "Zo\xEF\xBF\xBD!");
  EXPECT_EQ(userVisibleName("PRETTY_HOSTNAME=\"\x1B[1mKim\x07\x7F\t\xC2\x85\xE2\x80\xA8\"\n", ""), "[1mKim");
  EXPECT_EQ(userVisibleName("", "ph\xFFone\r\n"), "ph\xEF\xBF\xBDone");
  EXPECT_EQ(userVisibleName(std::string("PRETTY_HOSTNAME=\"K\0im\"\n", 23), ""), "Kim");
}

}  // namespace
}  // namespace zal::testing
