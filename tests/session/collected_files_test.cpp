#include "session/collected_files.h"

#include <gtest/gtest.h>
#include <sys/syscall.h>

#include <cerrno>

#include "collectors/file_collector.h"
#include "tests/support/failing_calls.h"
#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

TEST(CollectedFilesTest, KeepsCategoriesThatStayInside) {
  EXPECT_EQ(containedCategory("Ping"), "Ping");
  EXPECT_EQ(containedCategory(""), "");
  EXPECT_EQ(containedCategory("."), "");
  EXPECT_EQ(containedCategory("a/b"), "a/b");
  EXPECT_EQ(containedCategory("a/../b"), "b");
  EXPECT_EQ(containedCategory("..."), "...");
  EXPECT_EQ(containedCategory("é ü"), "é ü");
}

TEST(CollectedFilesTest, RefusesCategoriesThatLeadOut) {
  for (const std::string category :
       {"..", "../x", "/abs", "//abs", "a/../../b", "a/b/../../..", "./..", "a\nb", "\x7F"}) {
    EXPECT_EQ(containedCategory(category), std::nullopt) << category;
  }
  EXPECT_EQ(containedCategory(std::string_view("a\0b", 3)), std::nullopt);
}

TEST(CollectedFilesTest, ShowsSetsOfFiles) {
  EXPECT_EQ(fileSetText({}), "{}");
  EXPECT_EQ(fileSetText({"/a"}), "{/a}");
  EXPECT_EQ(fileSetText({"/b", "/a"}), "{/a, /b}");
}

TEST(CollectedFilesTest, ShowsControlCharactersAsQuestionMarks) {
  EXPECT_EQ(printable(std::string_view("a\nb\0c é", 8)), "a?b?c é");
}

class CollectedFilesMoveTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory home;
  testing::PlainFilePlacement files{home.path()};
  testing::RecordingAgentLog log;
  DirectoryRoots roots;
  FileCollector collector{files, log, roots};
  std::string directory = home / "session";

  CollectedFilesMoveTest() { std::filesystem::create_directory(directory); }
  std::string fileNamed(const std::string& name) {
    testing::writeFile(home / name, name);
    return home / name;
  }
  CollectedFilesMove moveOf(const FilesByCategory& wanted) { return {wanted, directory, collector, log}; }
  void place(const FilesByCategory& wanted) { moveOf(wanted).moveRest(); }
};

TEST_F(CollectedFilesMoveTest, MovesFilesIntoTheirCategory) {
  const std::string a = fileNamed("a.log");
  const std::string b = fileNamed("b.log");
  place({{"Ping", {a, b}}});
  EXPECT_EQ(testing::listTree(directory), "Ping/\nPing/a.log\nPing/b.log\n");
  EXPECT_FALSE(std::filesystem::exists(a));
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"notice: category:" + directory + "/Ping files={" + a + ", " + b + "}"});
}

TEST_F(CollectedFilesMoveTest, AnEmptyCategoryIsTheDirectoryItself) {
  place({{"", {fileNamed("a.log")}}});
  EXPECT_EQ(testing::listTree(directory), "a.log\n");
}

TEST_F(CollectedFilesMoveTest, PassesOverWhatIsMissing) {
  place({{"Ping", {home / "missing.log", fileNamed("there.log")}}});
  EXPECT_EQ(testing::listTree(directory), "Ping/\nPing/there.log\n");
}

TEST_F(CollectedFilesMoveTest, AFileThatCannotBeLookedAtForAMomentIsMoved) {
  const std::string a = fileNamed("a.log");
  if (!testing::withFailingCalls({{SYS_newfstatat, EIO, 1, testing::namesPath(a)}}, [&] {
        place({{"Ping", {a}}});
      }))
    GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_EQ(testing::listTree(directory), "Ping/\nPing/a.log\n");
}

TEST_F(CollectedFilesMoveTest, RefusesACategoryThatLeadsOutAndGoesOn) {
  const std::string a = fileNamed("a.log");
  const std::string b = fileNamed("b.log");
  place({{"../escaped", {a}}, {"Ping", {b}}});
  EXPECT_EQ(testing::listTree(home.path()), "a.log\nsession/\nsession/Ping/\nsession/Ping/b.log\n");
  EXPECT_EQ(log.lines,
            (std::vector<std::string>{
                "warning: Refused the file category \"../escaped\": it leads out of the session directory",
                "notice: category:" + directory + "/Ping files={" + b + "}"}));
}

TEST_F(CollectedFilesMoveTest, SkipsACategoryWhoseDirectoryCannotBeMade) {
  testing::writeFile(directory + "/Ping", "a file where a directory belongs");
  place({{"Ping", {fileNamed("a.log")}}, {"Video", {fileNamed("b.log")}}});
  EXPECT_EQ(testing::listTree(home.path()),
            "a.log\nsession/\nsession/Ping\nsession/Video/\nsession/Video/b.log\n");
}

TEST_F(CollectedFilesMoveTest, MakesDirectoriesOpenToEverybody) {
  place({{"a/b", {}}});
  EXPECT_EQ(std::filesystem::status(directory + "/a/b").permissions(), std::filesystem::perms::all);
}

TEST_F(CollectedFilesMoveTest, WithinAFileSystemItIsDoneAtOnce) {
  EXPECT_TRUE(
      moveOf({{"", {fileNamed("a.log")}}, {"../escaped", {fileNamed("b.log")}}}).moveWithinFileSystem());
  EXPECT_EQ(testing::listTree(home.path()), "b.log\nsession/\nsession/a.log\n");
}

TEST_F(CollectedFilesMoveTest, StopsAtAFileOfAnotherFileSystemAndGoesOnInTheSameOrder) {
  const FilesByCategory wanted{{"", {fileNamed("1.log"), fileNamed("2.log"), fileNamed("3.log")}},
                               {"Ping", {fileNamed("4.log")}}};
  files.isElsewhere = [](const std::string& source) { return source.ends_with("/2.log"); };
  auto move = moveOf(wanted);
  EXPECT_FALSE(move.moveWithinFileSystem());
  EXPECT_EQ(testing::listTree(home.path()), "2.log\n3.log\n4.log\nsession/\nsession/1.log\n");
  const std::vector<std::string> told = log.lines;
  EXPECT_FALSE(move.moveWithinFileSystem());
  move.moveRest();
  EXPECT_EQ(testing::listTree(home.path()),
            "session/\nsession/1.log\nsession/2.log\nsession/3.log\nsession/Ping/\nsession/Ping/4.log\n");
  EXPECT_EQ(log.lines.size(), told.size() + 1);  // a line for each category
  EXPECT_TRUE(move.moveWithinFileSystem());
}

}  // namespace
}  // namespace zal
