#include "session/date_text.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

constexpr LocalTime kTime{2024, 5, 2, 14, 3, 7, 251};
constexpr LocalTime kEarly{7, 1, 2, 3, 4, 5, 6};

TEST(DateTextTest, WritesTheDateOfASession) {
  EXPECT_EQ(sessionDateText(kTime), "2024-05-02 at 14-03-07");
  EXPECT_EQ(sessionDateText(kEarly), "0007-01-02 at 03-04-05");
}

TEST(DateTextTest, WritesTheTimeForFileNames) {
  EXPECT_EQ(fileTimeText(kTime), "14-03-07");
  EXPECT_EQ(fileTimeText(kEarly), "03-04-05");
}

TEST(DateTextTest, WritesEntryTimesWithTwoBlanks) {
  EXPECT_EQ(entryDateText(kTime), "14:03:07.251  (2024-05-02)");
  EXPECT_EQ(entryDateText(kEarly), "03:04:05.006  (0007-01-02)");
}

TEST(DateTextTest, WritesStamps) { EXPECT_EQ(stampText(kTime), "2024_05_02_14_03_07"); }

TEST(DateTextTest, ShowsYearsOfMoreThanFourDigitsWhole) {
  EXPECT_EQ(sessionDateText({10000, 1, 1, 0, 0, 0, 0}), "10000-01-01 at 00-00-00");
}

TEST(DateTextTest, ReplacesTheMillisecondsAlone) {
  std::string text = entryDateText(kTime);
  setEntryMilliseconds(text, 9);
  EXPECT_EQ(text, "14:03:07.009  (2024-05-02)");
  setEntryMilliseconds(text, 870);
  EXPECT_EQ(text, "14:03:07.870  (2024-05-02)");
}

}  // namespace
}  // namespace zal
