#include "platform/linux/archive/zip_check.h"

#include <gtest/gtest.h>

#include "platform/linux/archive/zip_archive.h"
#include "tests/linux/archive/archive_readers.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

class ZipCheckTest : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string text;
    for (int i = 0; i < 300; ++i) text += "line " + std::to_string(i) + "\n";
    writeFile(directory / "Dump/log.txt", text);
    writeFile(directory / "Dump/stored", "x");
    const auto outcome = writeZipArchive(directory / "Dump", archive, ArchiveCompression::fast, {},
                                         [](const std::string& line) { ADD_FAILURE() << line; });
    ASSERT_EQ(outcome.failure, "");
    ASSERT_EQ(outcome.entries, 3U);
    whole = readFile(archive);
  }

  const TemporaryDirectory directory;
  const std::string archive = directory / "archive.zip";
  std::string whole;
};

TEST_F(ZipCheckTest, AWholeArchiveHasNothingWrong) { EXPECT_EQ(checkZipArchive(archive, 3), ""); }

TEST_F(ZipCheckTest, EveryEntryIsCounted) {
  EXPECT_EQ(checkZipArchive(archive, 2), "its directory does not have 2 entries");
  EXPECT_EQ(checkZipArchive(archive, 4), "its directory does not have 4 entries");
}

TEST_F(ZipCheckTest, NoArchiveAtAllIsWrong) {
  EXPECT_EQ(checkZipArchive(directory / "nowhere.zip", 3), "No such file or directory");
}

TEST_F(ZipCheckTest, AnArchiveCutAnywhereIsWrong) {
  for (std::size_t size = 0; size < whole.size(); ++size) {
    writeFile(archive, whole.substr(0, size));
    EXPECT_NE(checkZipArchive(archive, 3), "") << size;
  }
}

TEST_F(ZipCheckTest, AnyChangedByteOfContentIsFound) {
  const std::size_t content = whole.find("Dump/log.txt") + 12 + 9;
  const std::size_t end = whole.find("PK\x03\x04", content);
  const std::string text = readFile(directory / "Dump/log.txt");
  std::size_t found = 0;
  for (std::size_t at = content; at < end; ++at) {
    std::string changed = whole;
    changed[at] = static_cast<char>(changed[at] ^ 0x10);
    writeFile(archive, changed);
    if (!checkZipArchive(archive, 3).empty()) {
      ++found;
    } else {
      // A bit that nobody looks at, behind the last block.
      EXPECT_EQ(printed("unzip -p '" + archive + "' Dump/log.txt"), text) << at - content;
    }
  }
  EXPECT_GE(found, end - content - 2);
  std::string changed = whole;
  changed[whole.find("Dump/stored") + 11 + 9] = 'y';
  writeFile(archive, changed);
  EXPECT_EQ(checkZipArchive(archive, 3), "\"Dump/stored\" has a wrong checksum");
}

TEST_F(ZipCheckTest, AHeaderThatSaysSomethingElseIsFound) {
  std::string changed = whole;
  changed[whole.find("Dump/log.txt")] = 'd';
  writeFile(archive, changed);
  EXPECT_EQ(checkZipArchive(archive, 3), "\"Dump/log.txt\" has a header that does not fit");
}

}  // namespace
}  // namespace zal::testing
