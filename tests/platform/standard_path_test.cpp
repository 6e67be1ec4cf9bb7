#include "platform/standard_path.h"

#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

class StandardPathTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory directory;
  const std::string home = std::filesystem::canonical(directory.path()).string();
};

TEST_F(StandardPathTest, LeadingHomeMarkIsTheHomeDirectory) {
  EXPECT_EQ(resolveAndStandardize("~", home), home);
  EXPECT_EQ(resolveAndStandardize("~/Logs/x", home), home + "/Logs/x");
}

TEST_F(StandardPathTest, HomeMarkElsewhereIsAName) {
  EXPECT_EQ(resolveAndStandardize("/nowhere/~/x", home), "/nowhere/~/x");
  EXPECT_EQ(resolveAndStandardize("/nowhere/~user", home), "/nowhere/~user");
  EXPECT_EQ(resolveAndStandardize("~user/x", home), "~user/x");
}

TEST_F(StandardPathTest, DotsDoubledAndTrailingSlashesGo) {
  EXPECT_EQ(resolveAndStandardize("/nowhere/./a//b/../c/", home), "/nowhere/a/c");
  EXPECT_EQ(resolveAndStandardize(home + "/", home), home);
  EXPECT_EQ(resolveAndStandardize("/", home), "/");
  EXPECT_EQ(resolveAndStandardize("/..", home), "/");
}

TEST_F(StandardPathTest, LinksAreFollowedAsFarAsThePathExists) {
  std::filesystem::create_directory(home + "/real");
  std::filesystem::create_directory_symlink(home + "/real", home + "/link");
  EXPECT_EQ(resolveAndStandardize("~/link/new/file", home), home + "/real/new/file");
  EXPECT_EQ(resolveAndStandardize("~/link/../x", home), home + "/x");
}

TEST_F(StandardPathTest, CircleOfLinksIsStandardisedAsText) {
  std::filesystem::create_symlink(home + "/b", home + "/a");
  std::filesystem::create_symlink(home + "/a", home + "/b");
  EXPECT_EQ(resolveAndStandardize("~/a/./x", home), home + "/a/x");
}

TEST_F(StandardPathTest, BelowARootOnlyTheRootsOwnLinksAreFollowed) {
  std::filesystem::create_directories(home + "/real/a");
  std::filesystem::create_directory_symlink("real", home + "/root");
  std::filesystem::create_directory_symlink("a", home + "/real/link");
  EXPECT_EQ(standardizeBelowRoot("~/root/link//./new/", "~/root", home), home + "/real/link/new");
  EXPECT_EQ(standardizeBelowRoot(home + "/real/link/new", "~/root", home), home + "/real/link/new");
  EXPECT_EQ(standardizeBelowRoot("~/root/../real/link/x", "~/root", home), home + "/real/link/x");
  EXPECT_EQ(standardizeBelowRoot("~/real/link/x", "~/other", home), home + "/real/a/x");
  EXPECT_EQ(standardizeBelowRoot("~/root", "~/root", home), home + "/real");
  EXPECT_EQ(standardizeBelowRoot("~/real/link", "", home), home + "/real/a");
}

TEST_F(StandardPathTest, EmptyPathStaysEmpty) { EXPECT_EQ(resolveAndStandardize("", home), ""); }

}  // namespace
}  // namespace zal
