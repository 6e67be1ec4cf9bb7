#include "dump/dump_texts.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/file_size_limit.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

TEST(DumpTextsTest, DeviceInfoLeavesOutWhatIsEmpty) {
  EXPECT_EQ(deviceInfoText("Kim's phone", "Model7,1"), "Name: Kim's phone   Device: Model7,1   ");
  EXPECT_EQ(deviceInfoText("", "Model7,1"), "Device: Model7,1   ");
  EXPECT_EQ(deviceInfoText("Kim's phone", ""), "Name: Kim's phone   ");
  EXPECT_EQ(deviceInfoText("", ""), "");
}

TEST(DumpTextsTest, AFileIsWrittenWholeAndReplaced) {
  const testing::TemporaryDirectory directory;
  writeWholeFile(directory / "Reason.txt", "a longer text");
  writeWholeFile(directory / "Reason.txt", "short");
  EXPECT_EQ(testing::readFile(directory / "Reason.txt"), "short");
  writeWholeFile(directory / "Empty.txt", "");
  EXPECT_EQ(testing::listTree(directory.path()), "Empty.txt\nReason.txt\n");
}

TEST(DumpTextsTest, AFileThatCannotBeWrittenLeavesNothing) {
  const testing::TemporaryDirectory directory;
  writeWholeFile(directory / "missing/Reason.txt", "text");
  // A directory stands where the file belongs.
  testing::writeFile(directory / "Reason.txt/inside", "kept");
  writeWholeFile(directory / "Reason.txt", "text");
  EXPECT_EQ(testing::listTree(directory.path()), "Reason.txt/\nReason.txt/inside\n");
}

TEST(DumpTextsTest, AFileThatTheDiskCannotHoldLeavesNothing) {
  const testing::TemporaryDirectory directory;
  {
    const testing::FileSizeLimit limit(2);
    writeWholeFile(directory / "Reason.txt", "text");
  }
  EXPECT_EQ(testing::listTree(directory.path()), "");
}

TEST(DumpTextsTest, ALinkLaidAtEitherNameIsNotFollowed) {
  const testing::TemporaryDirectory directory;
  testing::writeFile(directory / "victim", "untouched");
  std::filesystem::create_symlink(directory / "victim", directory / "Reason.txt");
  std::filesystem::create_symlink(directory / "victim", directory / "Reason.txt.unfinished");
  writeWholeFile(directory / "Reason.txt", "text");
  EXPECT_EQ(testing::readFile(directory / "victim"), "untouched");
  EXPECT_EQ(testing::readFile(directory / "Reason.txt"), "text");
  EXPECT_FALSE(std::filesystem::is_symlink(directory / "Reason.txt"));
  EXPECT_EQ(testing::listTree(directory.path()), "Reason.txt\nvictim\n");
}

}  // namespace
}  // namespace zal
