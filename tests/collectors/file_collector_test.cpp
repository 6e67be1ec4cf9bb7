#include "collectors/file_collector.h"

#include <sys/stat.h>

#include "tests/collectors/collector_fixture.h"

namespace zal {
namespace {

namespace fs = std::filesystem;

class FileCollectorTest : public testing::CollectorFixture {};

TEST_F(FileCollectorTest, LinkingANonexistentSourceReturnsFalseAndCreatesNoDirectory) {
  EXPECT_FALSE(collector.LinkFileIntoDirectory(in + "/missing.log", out + "/sub", ""));
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(FileCollectorTest, LinkingIntoANonexistentNestedDestinationMakesTheChainWithMode0777) {
  put("a.log");
  const mode_t umaskBefore = ::umask(077);
  const bool linked = collector.LinkFileIntoDirectory(in + "/a.log", out + "/x/y/z", "");
  ::umask(umaskBefore);
  EXPECT_TRUE(linked);
  EXPECT_TRUE(sameFile(in + "/a.log", out + "/x/y/z/a.log"));
  for (const auto* made : {"/x", "/x/y", "/x/y/z"}) {
    EXPECT_EQ(fs::status(out + made).permissions(), fs::perms::all) << made;
  }
}

TEST_F(FileCollectorTest, LinkingTwiceReturnsFalseAndLeavesTheFirstLink) {
  put("a.log");
  EXPECT_TRUE(collector.LinkFileIntoDirectory(in + "/a.log", out, ""));
  EXPECT_FALSE(collector.LinkFileIntoDirectory(in + "/a.log", out, ""));
  EXPECT_TRUE(sameFile(in + "/a.log", out + "/a.log"));
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(FileCollectorTest, LinkedFileStillGrowsWithItsWriter) {
  put("a.log");
  EXPECT_TRUE(collector.LinkFileIntoDirectory(in + "/a.log", out, ""));
  std::ofstream(in + "/a.log", std::ios::app) << "more\n";
  EXPECT_EQ(testing::readFile(out + "/a.log"), "content of a.log\nmore\n");
}

TEST_F(FileCollectorTest, LinkingExpandsTheHomeMarkAndAppendsTheSuffixToTheTargetOnly) {
  put("a.log");
  EXPECT_TRUE(collector.LinkFileIntoDirectory("~/sub/.././a.log", out, "-begin"));
  EXPECT_EQ(testing::listTree(out), "a.log-begin\n");
}

TEST_F(FileCollectorTest, LinkingASymbolicLinkTakesTheFileAndItsName) {
  put("real.log");
  fs::create_symlink(in + "/real.log", in + "/alias.log");
  EXPECT_TRUE(collector.LinkFileIntoDirectory(in + "/alias.log", out, ""));
  EXPECT_EQ(testing::listTree(out), "real.log\n");
  EXPECT_FALSE(fs::is_symlink(out + "/real.log"));
}

TEST_F(FileCollectorTest, EmptyPrefixLinksEveryEntryHiddenOnesIncluded) {
  put("d/one");
  put("d/.hidden");
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithPrefix("~/d", "", out));
  EXPECT_EQ(testing::listTree(out), ".hidden\none\n");
}

TEST_F(FileCollectorTest, PrefixLinksOnlyMatchingNamesInTheirExactCase) {
  put("d/abm-1");
  put("d/ABM-2");
  put("d/x-abm");
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithPrefix(in + "/d", "abm", out));
  EXPECT_EQ(testing::listTree(out), "abm-1\n");
}

TEST_F(FileCollectorTest, PrefixOverANonexistentDirectoryReturnsTrue) {
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithPrefix(in + "/missing", "", out));
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(FileCollectorTest, OneFailedLinkMakesTheResultFalseAndDoesNotStopTheLoop) {
  put("d/one");
  put("d/two");
  put("d/three");
  testing::writeFile(out + "/two", "taken");
  EXPECT_FALSE(collector.LinkDirectoryEntriesWithPrefix(in + "/d", "", out));
  EXPECT_EQ(testing::listTree(out), "one\nthree\ntwo\n");
  EXPECT_EQ(testing::readFile(out + "/two"), "taken");
}

TEST_F(FileCollectorTest, SuffixLinksOnlyNamesThatEndWithIt) {
  put("d/a.plist");
  put("d/a.plist.old");
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithSuffix(in + "/d", ".plist", out));
  EXPECT_EQ(testing::listTree(out), "a.plist\n");
}

TEST_F(FileCollectorTest, SuffixListsTheDirectoryAsPassedSoAHomeMarkFindsNothing) {
  put("d/a.plist");
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithSuffix("~/d", "", out));
  EXPECT_EQ(testing::listTree(out), "");
  EXPECT_TRUE(collector.LinkDirectoryEntriesWithSuffix(in + "/d", "", out));
  EXPECT_EQ(testing::listTree(out), "a.plist\n");
}

TEST_F(FileCollectorTest, MovingToATakenNameUsesTheUniqueVariantAndLeavesTheExistingFile) {
  put("ping.log");
  testing::writeFile(out + "/ping.log", "earlier");
  EXPECT_TRUE(collector.MoveFileIntoDirectory(in + "/ping.log", out, ""));
  EXPECT_EQ(testing::readFile(out + "/ping.log"), "earlier");
  EXPECT_EQ(testing::readFile(out + "/ping-2.log"), "content of ping.log\n");
  EXPECT_FALSE(fs::exists(in + "/ping.log"));
}

TEST_F(FileCollectorTest, MovingANonexistentSourceReturnsFalseAndCreatesNoDirectory) {
  EXPECT_FALSE(collector.MoveFileIntoDirectory(in + "/missing", out + "/sub", ""));
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(FileCollectorTest, MovingMakesTheDestinationAndAppendsTheSuffix) {
  put("ping.log");
  EXPECT_TRUE(collector.MoveFileIntoDirectory("~/ping.log", out + "/x/y", ".begin"));
  EXPECT_EQ(testing::listTree(out), "x/\nx/y/\nx/y/ping.log.begin\n");
  EXPECT_EQ(testing::listTree(in), "");
}

TEST_F(FileCollectorTest, FailedMoveReturnsFalseAndLeavesTheSource) {
  put("ping.log");
  files.failWith = [](const std::string&) { return std::make_error_code(std::errc::no_space_on_device); };
  EXPECT_FALSE(collector.MoveFileIntoDirectory(in + "/ping.log", out, ""));
  EXPECT_EQ(testing::readFile(in + "/ping.log"), "content of ping.log\n");
}

TEST_F(FileCollectorTest, AQuickMoveLeavesWhatLiesOnAnotherFileSystem) {
  put("ping.log");
  bool isElsewhere = true;
  files.isElsewhere = [&](const std::string&) { return isElsewhere; };
  EXPECT_EQ(collector.MoveFileWithinFileSystem(in + "/ping.log", out, ""), std::nullopt);
  EXPECT_TRUE(fs::exists(in + "/ping.log"));
  isElsewhere = false;
  EXPECT_EQ(collector.MoveFileWithinFileSystem(in + "/ping.log", out, ""), true);
  EXPECT_EQ(collector.MoveFileWithinFileSystem(in + "/ping.log", out, ""), false);
  EXPECT_EQ(testing::listTree(out), "ping.log\n");
}

class NoFreeName : public testing::PlainFilePlacement {
 public:
  using PlainFilePlacement::PlainFilePlacement;
  [[nodiscard]] std::optional<std::string> uniqueSavePath(const std::string& /*path*/) override {
    return std::nullopt;
  }
};

TEST_F(FileCollectorTest, MovingWithoutAnyFreeNameDeletesTheSource) {
  put("ping.log");
  NoFreeName noFreeName(in);
  FileCollector other(noFreeName, log, roots);
  EXPECT_TRUE(other.MoveFileIntoDirectory(in + "/ping.log", out, ""));
  EXPECT_EQ(testing::listTree(in), "");
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(FileCollectorTest, MovingTheRootDirectoryIsRefused) {
  EXPECT_FALSE(collector.MoveFileIntoDirectory("/", out, ""));
  EXPECT_FALSE(collector.MoveFileIntoDirectory("", out, ""));
  EXPECT_EQ(testing::listTree(out), "");
}

TEST_F(FileCollectorTest, ALinkInTheDirectoryThatEverybodyWritesToIsNeitherFollowedNorMoved) {
  put("secret");
  fs::create_directories(shared + "/plain");
  fs::create_symlink(in + "/secret", shared + "/vistel-ping.log");
  fs::create_directory_symlink(in, shared + "/way");
  for (const std::string name : {"/vistel-ping.log", "/way/secret", "/plain/../way/secret"}) {
    EXPECT_FALSE(collector.LinkFileIntoDirectory(shared + name, out, ""));
    EXPECT_FALSE(collector.MoveFileIntoDirectory(shared + name, out, ""));
  }
  EXPECT_EQ(testing::listTree(out), "");
  EXPECT_EQ(testing::readFile(in + "/secret"), "content of secret\n");
  ASSERT_EQ(log.lines.size(), 6U);
  EXPECT_EQ(log.lines[0], "warning: " + shared +
                              "/vistel-ping.log is not taken: a symbolic link that anybody " +
                              "may have laid leads to " + in + "/secret");
}

TEST_F(FileCollectorTest, APlainFileThereIsTakenAndTheEntriesBesideALinkToo) {
  put("secret");
  testing::writeFile(shared + "/uart-1", "one");
  fs::create_symlink(in + "/secret", shared + "/uart-2");
  testing::writeFile(shared + "/uart-3", "three");
  EXPECT_FALSE(collector.LinkDirectoryEntriesWithPrefix(shared, "uart-", out));
  EXPECT_EQ(testing::listTree(out), "uart-1\nuart-3\n");
  EXPECT_TRUE(collector.MoveFileIntoDirectory(shared + "//uart-1", out + "/moved", ""));
  EXPECT_EQ(testing::readFile(out + "/moved/uart-1"), "one");
}

}  // namespace
}  // namespace zal
