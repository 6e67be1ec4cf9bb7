#include "platform/linux/helper/dump_files.h"

#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal::helper {
namespace {

using namespace std::chrono_literals;
using Lines = std::vector<std::string>;

class DumpFilesTest : public ::testing::Test {
 protected:
  [[nodiscard]] std::string listing() const { return testing::listTree(directory.path()); }
  [[nodiscard]] std::string content(const std::string& name) const {
    return testing::readFile(directory / ("p-" + name));
  }

  testing::TemporaryDirectory directory;
  testing::TemporaryDirectory elsewhere;
  Patience patience{60s};
  DumpFiles files{directory.path(), "p-"};
};

TEST_F(DumpFilesTest, ASourceIsAFileAndALine) {
  EXPECT_FALSE(files.gaveSomething());
  files.write("a.txt", "four", "a\nremark");
  EXPECT_EQ(content("a.txt"), "four");
  EXPECT_EQ(files.lines(), Lines{"a.txt: 4 bytes (a\\x0aremark)"});
  EXPECT_TRUE(files.gaveSomething());
}

TEST_F(DumpFilesTest, MissingSourceIsALineAloneAndNothingGiven) {
  files.missing("somewhere", "not there");
  files.writeNote("note.txt", "a\nreason", patience);
  EXPECT_EQ(content("note.txt"), "reason: a\\x0areason\nnot had: somewhere: not there\n");
  EXPECT_FALSE(files.gaveSomething());
  EXPECT_FALSE(files.hasFailed());
}

TEST_F(DumpFilesTest, OutcomeWithoutOutputIsMissingAndItsReasonIsInTheFileWhereThatIsWanted) {
  files.writeOutcome("a.json", "tool",
                     {.output = "", .errors = "no modem\nmore", .trouble = "ended with status 1"}, false);
  files.writeOutcome("b.txt", "tool", {.output = "", .errors = "", .trouble = "not installed"}, true);
  files.writeOutcome("c.txt", "tool", {.output = "", .errors = "", .trouble = ""}, true);
  EXPECT_EQ(listing(), "p-b.txt\np-c.txt\n");
  EXPECT_EQ(content("b.txt"), "(tool: not installed)\n");
  EXPECT_EQ(content("c.txt"), "(tool: said nothing)\n");
  EXPECT_EQ(files.lines(), (Lines{"not had: tool: ended with status 1: no modem",
                                  "not had: tool: not installed", "not had: tool: said nothing"}));
  EXPECT_FALSE(files.gaveSomething());
}

TEST_F(DumpFilesTest, PartOfAnOutcomeIsKeptWithWhyItIsNotAll) {
  files.writeOutcome("a.txt", "tool", {.output = "half\n", .errors = "oh\n", .trouble = "cut off after 5 ms"},
                     true);
  EXPECT_EQ(content("a.txt"), "half\noh\n(tool: cut off after 5 ms)\n");
  EXPECT_EQ(files.lines(), Lines{"a.txt: 35 bytes (cut off after 5 ms: oh)"});
}

TEST_F(DumpFilesTest, CopyIsCutAtItsMost) {
  testing::writeFile(elsewhere / "source", std::string(200000, 'x'));
  EXPECT_TRUE(files.copy("all.bin", elsewhere / "source", 200000, patience));
  EXPECT_TRUE(files.copy("cut.bin", elsewhere / "source", 70000, patience));
  EXPECT_EQ(content("all.bin").size(), 200000U);
  EXPECT_EQ(content("cut.bin").size(), 70000U);
  EXPECT_EQ(files.lines(), (Lines{"all.bin: 200000 bytes of " + elsewhere / "source",
                                  "cut.bin: 70000 bytes of " + elsewhere / "source (cut at 70000 bytes)"}));
}

TEST_F(DumpFilesTest, CopyOfNothingLeavesNothing) {
  testing::writeFile(elsewhere / "empty", "");
  EXPECT_FALSE(files.copy("a.bin", elsewhere / "empty", 10, patience));
  EXPECT_FALSE(files.copy("b.bin", elsewhere / "none", 10, patience));
  Patience none(0s);
  testing::writeFile(elsewhere / "full", "x");
  EXPECT_FALSE(files.copy("c.bin", elsewhere / "full", 10, none));
  EXPECT_EQ(listing(), "");
  EXPECT_EQ(files.lines(), (Lines{"not had: " + elsewhere / "empty: is empty",
                                  "not had: " + elsewhere / "none: No such file or directory",
                                  "not had: " + elsewhere / "full: cut off: its time of 0 ms was up"}));
}

TEST_F(DumpFilesTest, FileThatCannotBeWrittenIsToldAndRemembered) {
  std::filesystem::create_directories(directory / "p-a.txt/in the way");
  files.write("a.txt", "text");
  EXPECT_TRUE(files.hasFailed());
  EXPECT_FALSE(files.gaveSomething());
  EXPECT_EQ(files.lines(), Lines{"a.txt: cannot be written: Is a directory"});
  EXPECT_EQ(listing(), "p-a.txt/\np-a.txt/in the way/\n");
}

TEST_F(DumpFilesTest, ADirectoryThatIsALinkGetsNothingAndTheLinesSaySo) {
  const std::string link = directory / "link";
  std::filesystem::create_directory_symlink(elsewhere.path(), link);
  testing::writeFile(elsewhere / "source", "text");
  DumpFiles through(link, "p-");
  through.write("a.txt", "four");
  EXPECT_FALSE(through.copy("b.txt", elsewhere / "source", 100, patience));
  EXPECT_TRUE(through.hasFailed());
  EXPECT_EQ(through.lines(), (Lines{"a.txt: cannot be written: Not a directory",
                                    "b.txt: cannot be written: Not a directory"}));
  EXPECT_EQ(testing::listTree(elsewhere.path()), "source\n");
}

TEST_F(DumpFilesTest, ALinkThatTakesTheDirectorysNameMeanwhileIsNotFollowed) {
  const std::string place = directory / "reports", moved = directory / "moved";
  std::filesystem::create_directory(place);
  testing::writeFile(directory / "source", "text");
  DumpFiles reports(place, "p-");
  std::filesystem::rename(place, moved);
  std::filesystem::create_directory_symlink(elsewhere.path(), place);
  reports.write("a.txt", "four");
  EXPECT_TRUE(reports.copy("b.txt", directory / "source", 100, patience));
  EXPECT_EQ(testing::listTree(elsewhere.path()), "");
  EXPECT_EQ(testing::readFile(moved + "/p-a.txt"), "four");
  EXPECT_EQ(testing::readFile(moved + "/p-b.txt"), "text");
}

}  // namespace
}  // namespace zal::helper
