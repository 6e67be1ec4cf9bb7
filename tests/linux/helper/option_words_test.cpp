#include "platform/linux/helper/option_words.h"

#include <gtest/gtest.h>

namespace zal::helper {
namespace {

using namespace std::chrono_literals;

class OptionWordsTest : public ::testing::Test {
 protected:
  bool take(const std::vector<std::string>& words) {
    return takeOptions(words, {.texts = {{"--text", &text}}, .times = {{"--time", &time}}});
  }
  std::string text = "usual";
  std::chrono::seconds time{5};
};

TEST_F(OptionWordsTest, EachValueGoesIntoItsPlaceAndOthersKeepTheirs) {
  EXPECT_TRUE(take({}));
  EXPECT_EQ(text, "usual");
  EXPECT_TRUE(take({"--time", "7", "--text", "--time"}));
  EXPECT_EQ(text, "--time");
  EXPECT_EQ(time, 7s);
}

TEST_F(OptionWordsTest, OtherWordsAndNoNumbersAreRefused) {
  EXPECT_FALSE(take({"--text"}));
  EXPECT_FALSE(take({"--other", "x"}));
  for (const char* const number : {"", "-1", "1s", "99999999999999"}) EXPECT_FALSE(take({"--time", number}));
}

}  // namespace
}  // namespace zal::helper
