#include "platform/linux/archive/inspect_archive.h"

#include <fcntl.h>

#include <gtest/gtest.h>

#include "platform/linux/archive/zip_archive.h"
#include "platform/linux/files/descriptor.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using Lines = std::vector<std::string>;

/// A small archive that a test changes before it is looked at.
class InspectArchiveTest : public ::testing::Test {
 protected:
  void SetUp() override {
    writeFile(directory / "Dump/a.log", std::string(200'000, 'a'));
    writeFile(directory / "Dump/b", "x");
    const auto outcome = writeZipArchive(directory / "Dump", archive, ArchiveCompression::fast,
                                         {"Manifest.json", [](const ArchiveContent&) { return "{}"; }},
                                         [](const std::string& line) { ADD_FAILURE() << line; });
    ASSERT_EQ(outcome.failure, "");
    bytes = readFile(archive);
  }
  [[nodiscard]] ArchiveInspection inspect() {
    writeFile(archive, bytes);
    const Descriptor file(::open(archive.c_str(), O_RDONLY | O_CLOEXEC));
    return inspectArchive(file.get());
  }
  [[nodiscard]] Lines troubles() {
    const ArchiveInspection found = inspect();
    Lines lines;
    if (!found.trouble.empty()) lines.push_back(found.trouble);
    for (const InspectedEntry& entry : found.entries) {
      if (!entry.trouble.empty()) lines.push_back(entry.name + " " + entry.trouble);
    }
    return lines;
  }
  /// Puts a number of four bytes into the directory's row of the file.
  void setInDirectory(const std::string& name, std::size_t field, std::uint32_t value) {
    const std::size_t row = bytes.rfind(name) - 46;
    ASSERT_EQ(bytes.substr(row, 4), "PK\x01\x02");
    for (std::size_t i = 0; i < 4; ++i) bytes[row + field + i] = static_cast<char>(value >> (8 * i));
  }

  const TemporaryDirectory directory;
  const std::string archive = directory / "archive.zip";
  std::string bytes;
};

TEST_F(InspectArchiveTest, WholeArchiveIsReadWithHashesAndTheLastText) {
  const ArchiveInspection found = inspect();
  EXPECT_TRUE(found.isArchive);
  EXPECT_EQ(troubles(), Lines{});
  ASSERT_EQ(found.entries.size(), 4U);
  EXPECT_EQ(found.entries[0].name, "Dump/");
  EXPECT_EQ(found.entries[1].bytes, 200'000U);
  EXPECT_EQ(found.entries[2].sha256, "2d711642b726b04401627ca9fbac32f5c8530fb1903cc4db02258717921a4881");
  EXPECT_EQ(found.lastText, "{}");
}

TEST_F(InspectArchiveTest, EntryThatUnpacksToMoreThanItSaysIsLeftThere) {
  setInDirectory("Dump/a.log", 24, 1000);
  EXPECT_EQ(troubles(), Lines{"Dump/a.log cannot be unpacked"});
}

TEST_F(InspectArchiveTest, EntriesThatShareBytesAreNotUnpacked) {
  const std::size_t row = bytes.rfind("Dump/a.log") - 46;
  const std::size_t next = bytes.find("PK\x01\x02", row + 4);
  const std::string again = bytes.substr(row, next - row);
  bytes.insert(next, again);
  const std::size_t end = bytes.rfind("PK\x05\x06");
  bytes[end + 8] = bytes[end + 10] = 5;
  bytes[end + 12] = static_cast<char>(bytes[end + 12] + static_cast<char>(again.size()));
  EXPECT_EQ(troubles(), Lines{"Dump/a.log shares bytes with another entry"});
}

TEST_F(InspectArchiveTest, DirectoryThatBreaksOffIsTold) {
  bytes[bytes.rfind("Dump/Manifest.json") - 46] = 'Q';
  EXPECT_EQ(troubles(), Lines{"its directory breaks off after 3 of 4 entries"});
  bytes.pop_back();
  EXPECT_EQ(troubles(), Lines{"it has no directory at its end"});
}

TEST_F(InspectArchiveTest, OtherFilesAreNoArchives) {
  for (const char* text : {"", "PK", "a text that is no archive at all"}) {
    bytes = text;
    EXPECT_FALSE(inspect().isArchive) << text;
  }
}

}  // namespace
}  // namespace zal::testing
