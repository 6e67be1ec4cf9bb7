#include "platform/open_directories.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

namespace fs = std::filesystem;

class OpenDirectoriesTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory directory;
};

TEST_F(OpenDirectoriesTest, OnlyTheDirectoriesThatWereMadeGetMode0777) {
  fs::create_directory(directory / "old");
  fs::permissions(directory / "old", fs::perms::owner_all);
  const mode_t umaskBefore = ::umask(077);
  const std::error_code error = createDirectoriesWithMode0777(directory / "old/new/newer/");
  ::umask(umaskBefore);
  EXPECT_FALSE(error);
  EXPECT_EQ(fs::status(directory / "old").permissions(), fs::perms::owner_all);
  EXPECT_EQ(fs::status(directory / "old/new").permissions(), fs::perms::all);
  EXPECT_EQ(fs::status(directory / "old/new/newer").permissions(), fs::perms::all);
}

TEST_F(OpenDirectoriesTest, DirectoryThatExistsIsNoError) {
  EXPECT_FALSE(createDirectoriesWithMode0777(directory.path()));
}

TEST_F(OpenDirectoriesTest, FileInTheWayIsAnError) {
  testing::writeFile(directory / "file", "");
  EXPECT_TRUE(createDirectoriesWithMode0777(directory / "file"));
  EXPECT_TRUE(createDirectoriesWithMode0777(directory / "file/below"));
  EXPECT_EQ(testing::listTree(directory.path()), "file\n");
}

TEST_F(OpenDirectoriesTest, EmptyPathIsAnError) { EXPECT_TRUE(createDirectoriesWithMode0777("")); }

}  // namespace
}  // namespace zal
