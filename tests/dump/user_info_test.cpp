#include "dump/user_info.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

const ValueMap kInfo = {{"text", "abc"},
                        {"minus", std::int64_t{-3}},
                        {"wide", std::uint64_t{0x1'0000'0005}},
                        {"real", 2.9},
                        {"huge", 1e300},
                        {"yes", true},
                        {"zero", std::int64_t{0}},
                        {"null", nullptr}};

TEST(UserInfoTest, AMissingDictionaryHoldsNothing) {
  EXPECT_EQ(textOf(nullptr, "text"), std::nullopt);
  EXPECT_EQ(integerOf(nullptr, "minus"), 0);
  EXPECT_EQ(booleanOf(nullptr, "yes"), std::nullopt);
}

TEST(UserInfoTest, OnlyATextIsAText) {
  EXPECT_EQ(textOf(&kInfo, "text"), "abc");
  EXPECT_EQ(textOf(&kInfo, "minus"), std::nullopt);
  EXPECT_EQ(textOf(&kInfo, "absent"), std::nullopt);
}

TEST(UserInfoTest, IntegersAreCutTo32Bits) {
  EXPECT_EQ(integerOf(&kInfo, "minus"), -3);
  EXPECT_EQ(integerOf(&kInfo, "wide"), 5);
  EXPECT_EQ(integerOf(&kInfo, "real"), 2);
  EXPECT_EQ(integerOf(&kInfo, "huge"), 0);
  EXPECT_EQ(integerOf(&kInfo, "yes"), 1);
  EXPECT_EQ(integerOf(&kInfo, "text"), 0);
}

TEST(UserInfoTest, ABooleanThatIsThereIsNeverNothing) {
  EXPECT_EQ(booleanOf(&kInfo, "yes"), true);
  EXPECT_EQ(booleanOf(&kInfo, "zero"), false);
  EXPECT_EQ(booleanOf(&kInfo, "real"), true);
  EXPECT_EQ(booleanOf(&kInfo, "null"), false);
  EXPECT_EQ(booleanOf(&kInfo, "text"), false);
  EXPECT_EQ(booleanOf(&kInfo, "absent"), std::nullopt);
}

}  // namespace
}  // namespace zal
