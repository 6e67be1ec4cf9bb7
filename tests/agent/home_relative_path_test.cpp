#include "agent/home_relative_path.h"

#include <gtest/gtest.h>

namespace zal {
namespace {

TEST(HomeRelativePathTest, WritesATildeForTheHomeDirectory) {
  EXPECT_EQ(homeRelativePath("/home/user/Logs", "/home/user"), "~/Logs");
  EXPECT_EQ(homeRelativePath("/home/user/Logs", "/home/user/"), "~/Logs");
  EXPECT_EQ(homeRelativePath("/home/user", "/home/user"), "~");
}

TEST(HomeRelativePathTest, LeavesPathsElsewhereAlone) {
  EXPECT_EQ(homeRelativePath("/home/user2/Logs", "/home/user"), "/home/user2/Logs");
  EXPECT_EQ(homeRelativePath("/var/log", "/"), "/var/log");
  EXPECT_EQ(homeRelativePath("~/Logs", "/home/user"), "~/Logs");
}

}  // namespace
}  // namespace zal
