#include "platform/value.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(ValueTest, NumbersPrintInTheirShortestForm) {
  EXPECT_EQ(numberText(5.0), "5");
  EXPECT_EQ(numberText(4.5), "4.5");
  EXPECT_EQ(numberText(std::int64_t{-3}), "-3");
  EXPECT_EQ(numberText(std::uint64_t{18446744073709551615U}), "18446744073709551615");
  EXPECT_EQ(numberText(true), "1");
  EXPECT_EQ(numberText(0.1), "0.1");
}

TEST(ValueTest, ANumberKeepsItsValueAsDouble) {
  EXPECT_EQ(numberAsDouble(std::int64_t{-3}), -3.0);
  EXPECT_EQ(numberAsDouble(false), 0.0);
}

TEST(ValueTest, AValueHoldsTheKindItWasGiven) {
  EXPECT_NE(Value("text").as<std::string>(), nullptr);
  EXPECT_NE(Value(14).as<std::int64_t>(), nullptr);
  EXPECT_NE(Value(true).as<bool>(), nullptr);
  EXPECT_EQ(Value(1.5).as<std::int64_t>(), nullptr);
}

}  // namespace
}  // namespace zal
