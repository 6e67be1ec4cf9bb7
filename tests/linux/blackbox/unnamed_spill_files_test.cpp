#include "platform/linux/blackbox/unnamed_spill_files.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>

#include "tests/support/file_size_limit.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

class UnnamedSpillFilesTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory directory;
  UnnamedSpillFiles files{directory / "BlackBox"};
  std::unique_ptr<SpillFile> file = files.make();
};

TEST_F(UnnamedSpillFilesTest, GivesBackWhatItWasGivenFromAnyPlace) {
  ASSERT_TRUE(file->append("first "));
  ASSERT_TRUE(file->append("second"));
  EXPECT_EQ(file->size(), 12U);
  char buffer[6];
  ASSERT_TRUE(file->read(6, buffer, sizeof buffer));
  EXPECT_EQ(std::string_view(buffer, sizeof buffer), "second");
  EXPECT_FALSE(file->read(7, buffer, sizeof buffer));
}

TEST_F(UnnamedSpillFilesTest, NobodyFindsItInItsPrivateDirectory) {
  EXPECT_FALSE(std::filesystem::exists(directory / "BlackBox"));
  ASSERT_TRUE(file->append("secret"));
  EXPECT_TRUE(std::filesystem::is_empty(directory / "BlackBox"));
  struct stat status {};
  ASSERT_EQ(::stat((directory / "BlackBox").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0700U);
}

TEST_F(UnnamedSpillFilesTest, SaysWhyThereIsNoRoom) {
  std::filesystem::create_directories(directory.path());
  testing::writeFile(directory / "BlackBox", "in the way");
  EXPECT_FALSE(file->append("text"));
  EXPECT_NE(file->trouble().find((directory / "BlackBox") + ": "), std::string::npos);
  EXPECT_EQ(file->size(), 0U);
}

TEST_F(UnnamedSpillFilesTest, WhatDidNotFitWholeDoesNotCount) {
  ASSERT_TRUE(file->append("fits"));
  {
    const testing::FileSizeLimit limit(6);
    EXPECT_FALSE(file->append("too long"));
  }
  EXPECT_EQ(file->size(), 4U);
  ASSERT_TRUE(file->append("!"));
  char buffer[5];
  ASSERT_TRUE(file->read(0, buffer, sizeof buffer));
  EXPECT_EQ(std::string_view(buffer, sizeof buffer), "fits!");
}

}  // namespace
}  // namespace zal
