#include "collectors/file_url.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(FileUrlTest, KeepsWhatAPathUsuallyHolds) {
  EXPECT_EQ(fileUrl("/var/log/a-b_c.0~(1)"), "file:///var/log/a-b_c.0~(1)");
}

TEST(FileUrlTest, EscapesBlanksControlCharactersPercentSignsAndBytesBeyondAscii) {
  EXPECT_EQ(fileUrl("/a b\n%\xC3\xA9?#"), "file:///a%20b%0A%25%C3%A9%3F%23");
}

}  // namespace
}  // namespace zal
