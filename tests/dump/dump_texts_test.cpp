#include "dump/dump_texts.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/fake_services.h"
#include "tests/support/file_size_limit.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

class DumpTextsTest : public ::testing::Test {
 protected:
  void write(const std::string& path, std::string_view text) { writeWholeFile(files, log, path, text); }
  testing::TemporaryDirectory directory;
  testing::RecordingAgentLog log;
  testing::PlainFilePlacement files{directory / "home"};
};

TEST_F(DumpTextsTest, DeviceInfoLeavesOutWhatIsEmpty) {
  EXPECT_EQ(deviceInfoText("Kim's phone", "Model7,1"), "Name: Kim's phone   Device: Model7,1   ");
  EXPECT_EQ(deviceInfoText("", "Model7,1"), "Device: Model7,1   ");
  EXPECT_EQ(deviceInfoText("Kim's phone", ""), "Name: Kim's phone   ");
  EXPECT_EQ(deviceInfoText("", ""), "");
}

TEST_F(DumpTextsTest, AFileIsWrittenWholeAndReplaced) {
  write(directory / "Reason.txt", "a longer text");
  write(directory / "Reason.txt", "short");
  EXPECT_EQ(testing::readFile(directory / "Reason.txt"), "short");
  write(directory / "Empty.txt", "");
  EXPECT_EQ(testing::listTree(directory.path()), "Empty.txt\nReason.txt\n");
}

TEST_F(DumpTextsTest, AFileThatCannotBeWrittenLeavesNothing) {
  write(directory / "missing/Reason.txt", "text");
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Could not write " + directory.path() +
                                                "/missing/Reason.txt: No such file or directory"});
  // A directory stands where the file belongs.
  testing::writeFile(directory / "Reason.txt/inside", "kept");
  write(directory / "Reason.txt", "text");
  EXPECT_EQ(testing::listTree(directory.path()), "Reason.txt/\nReason.txt/inside\n");
}

TEST_F(DumpTextsTest, AFileThatTheDiskCannotHoldLeavesNothing) {
  {
    const testing::FileSizeLimit limit(2);
    write(directory / "Reason.txt", "text");
  }
  EXPECT_EQ(testing::listTree(directory.path()), "");
}

TEST_F(DumpTextsTest, ALinkLaidAtEitherNameIsNotFollowed) {
  testing::writeFile(directory / "victim", "untouched");
  std::filesystem::create_symlink(directory / "victim", directory / "Reason.txt");
  std::filesystem::create_symlink(directory / "victim", directory / "Reason.txt.unfinished");
  write(directory / "Reason.txt", "text");
  EXPECT_EQ(testing::readFile(directory / "victim"), "untouched");
  EXPECT_EQ(testing::readFile(directory / "Reason.txt"), "text");
  EXPECT_FALSE(std::filesystem::is_symlink(directory / "Reason.txt"));
  EXPECT_EQ(testing::listTree(directory.path()), "Reason.txt\nvictim\n");
}

}  // namespace
}  // namespace zal
