#include "platform/linux/archive/zip_contents.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// Archives that the usual tool makes.
class ZipContentsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    writeFile(directory / "Top/a.log", "first\n");
    writeFile(directory / "Top/sub/empty", "");
    std::filesystem::create_directories(directory / "Top/nothing");
    std::filesystem::create_symlink("a.log", directory / "Top/link");
    const std::string command = "cd '" + directory.path() + "' && zip -q -r -y made.zip Top";
    ASSERT_EQ(std::system(command.c_str()), 0);
  }
  TemporaryDirectory directory;
};

TEST_F(ZipContentsTest, ListsRegularFilesOnly) {
  const auto entries = listZip(directory / "made.zip");
  ASSERT_TRUE(entries);
  std::vector<std::string> lines;
  for (const ZipEntry& entry : *entries) lines.push_back(entry.name + " " + std::to_string(entry.bytes));
  std::sort(lines.begin(), lines.end());
  EXPECT_EQ(lines, (std::vector<std::string>{"Top/a.log 6", "Top/sub/empty 0"}));
}

TEST_F(ZipContentsTest, ReadsAFileWhole) {
  EXPECT_EQ(readZipEntry(directory / "made.zip", "Top/a.log"), "first\n");
  EXPECT_EQ(readZipEntry(directory / "made.zip", "Top/sub/empty"), "");
  EXPECT_EQ(readZipEntry(directory / "made.zip", "Top/link"), std::nullopt);
  EXPECT_EQ(readZipEntry(directory / "made.zip", "Top"), std::nullopt);
}

TEST_F(ZipContentsTest, AWrongChecksumIsNoText) {
  std::string bytes = readFile(directory / "made.zip");
  bytes[bytes.find("first\n")] = 'F';  // too small to be worth compressing, so it stands there as it is
  writeFile(directory / "made.zip", bytes);
  EXPECT_EQ(readZipEntry(directory / "made.zip", "Top/a.log"), std::nullopt);
}

TEST_F(ZipContentsTest, WhatIsNoArchiveIsNothing) {
  writeFile(directory / "torn.zip", readFile(directory / "made.zip").substr(0, 60));
  EXPECT_EQ(listZip(directory / "torn.zip"), std::nullopt);
  EXPECT_EQ(listZip(directory / "absent.zip"), std::nullopt);
  EXPECT_EQ(listZip(directory.path()), std::nullopt);
  EXPECT_EQ(readZipEntry(directory / "torn.zip", "Top/a.log"), std::nullopt);
}

}  // namespace
}  // namespace zal::testing
