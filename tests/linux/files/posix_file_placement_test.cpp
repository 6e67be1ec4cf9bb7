#include "platform/linux/files/posix_file_placement.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <set>
#include <string>

#include "platform/linux/files/rename_no_replace.h"
#include "platform/linux/files/temporary_leftovers.h"
#include "tests/support/failing_calls.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

namespace fs = std::filesystem;

class PosixFilePlacementTest : public ::testing::Test {
 protected:
  std::error_code move(const std::string& source, const std::string& target) {
    return files.move(directory / source, directory / target);
  }
  /// What the path becomes, without the directory.
  std::string uniqueName(const std::string& name) {
    const auto path = files.uniqueSavePath(directory / name);
    return path ? path->substr(directory.path().size() + 1) : "(none)";
  }
  void putLargeFile(const std::string& name) {
    writeFile(directory / name, std::string(300'000, 'x'));
    ::chmod((directory / name).c_str(), 0604);
    setTime(directory / name, 1500000000, 7);
  }
  static void expectLargeFile(const std::string& path) {
    EXPECT_EQ(readFile(path), std::string(300'000, 'x'));
    EXPECT_EQ(modeAndTime(path), "604 1500000000000000007");
  }
  TemporaryDirectory directory;
  PosixFilePlacement files{directory / "home", directory / "temporary"};
};

TEST_F(PosixFilePlacementTest, SaysWhereHomeIs) { EXPECT_EQ(files.homeDirectory(), directory / "home"); }

// Roots

class PlacementBelowRootsTest : public PosixFilePlacementTest {
 protected:
  PlacementBelowRootsTest() {
    fs::create_directories(directory / "root/real");
    fs::create_directory(directory / "elsewhere");
    fs::create_directory_symlink(directory / "elsewhere", directory / "root/planted");
    writeFile(directory / "file", "content");
  }
  void expectRefused(const std::error_code& error) const {
    EXPECT_EQ(error, std::errc::too_many_symbolic_link_levels);
    EXPECT_EQ(listTree(directory / "elsewhere"), "");
    EXPECT_EQ(readFile(directory / "file"), "content");
  }
  const std::string behindTheLink = directory / "root/planted/file";
  PosixFilePlacement rooted{directory / "home", directory / "temporary", {directory / "root"}};
};

TEST_F(PlacementBelowRootsTest, NothingIsPlacedThroughALinkBelowARoot) {
  expectRefused(rooted.link(directory / "file", behindTheLink));
  expectRefused(rooted.move(directory / "file", behindTheLink));
  expectRefused(rooted.copy(directory / "file", behindTheLink));
  expectRefused(rooted.copy(directory / "root/real", behindTheLink));
  expectRefused(rooted.prepareOutput(behindTheLink));
  expectRefused(rooted.makeDirectories(behindTheLink));
  expectRefused(rooted.replace(directory / "file", behindTheLink));
  expectRefused(rooted.linkSymbolically("text", behindTheLink));
  EXPECT_EQ(rooted.openFresh(behindTheLink), nullptr);
  expectRefused({errno, std::generic_category()});
}

TEST_F(PlacementBelowRootsTest, NothingIsRemovedOrTakenAwayBehindALink) {
  writeFile(directory / "elsewhere/file", "old");
  EXPECT_EQ(rooted.remove(behindTheLink), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(rooted.replace(behindTheLink, directory / "root/real/file"),
            std::errc::too_many_symbolic_link_levels);
  EXPECT_FALSE(rooted.remove(directory / "root/planted"));
  EXPECT_EQ(listTree(directory / "elsewhere"), "file\n");
  EXPECT_EQ(listTree(directory / "root"), "real/\n");
}

TEST_F(PlacementBelowRootsTest, AnotherUsersFileBehindALinkIsNotReplacedByAnOutput) {
  writeFile(directory / "elsewhere/file", "old");
  EXPECT_EQ(rooted.prepareOutput(behindTheLink), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(readFile(directory / "elsewhere/file"), "old");
}

TEST_F(PlacementBelowRootsTest, SourcesMayBeReachedThroughLinks) {
  writeFile(directory / "elsewhere/source", "content");
  EXPECT_FALSE(rooted.link(directory / "root/planted/source", directory / "root/real/a"));
  EXPECT_FALSE(rooted.move(directory / "root/planted/source", directory / "root/real/b"));
  EXPECT_EQ(listTree(directory / "root/real"), "a\nb\n");
}

// Fresh files

TEST_F(PosixFilePlacementTest, AFreshFileIsEmptyWhateverHadTheName) {
  writeFile(directory / "victim", "untouched");
  fs::create_hard_link(directory / "victim", directory / "hard");
  fs::create_symlink("victim", directory / "symbolic");
  for (const std::string name : {"new", "hard", "symbolic"}) {
    std::FILE* const file = files.openFresh(directory / name);
    ASSERT_NE(file, nullptr) << name;
    EXPECT_GE(std::fputs("mine", file), 0);
    EXPECT_EQ(std::fclose(file), 0);
    EXPECT_EQ(readFile(directory / name), "mine");
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(directory / name))) << name;
  }
  EXPECT_EQ(readFile(directory / "victim"), "untouched");
}

TEST_F(PosixFilePlacementTest, AFreshFileTakesNoDirectorysPlaceAndADeviceIsOpenedAsItIs) {
  fs::create_directory(directory / "taken");
  EXPECT_EQ(files.openFresh(directory / "taken"), nullptr);
  EXPECT_EQ(files.openFresh(directory / "missing/file"), nullptr);
  EXPECT_EQ(errno, ENOENT);
  std::FILE* const device = files.openFresh("/dev/full");
  ASSERT_NE(device, nullptr);
  EXPECT_EQ(std::fclose(device), 0);
}

TEST_F(PosixFilePlacementTest, ARemovalTakesTreesAndLinksButNotWhatTheyLeadTo) {
  writeFile(directory / "tree/a/file", "");
  writeFile(directory / "kept/file", "");
  fs::create_directory_symlink("../kept", directory / "tree/link");
  EXPECT_FALSE(files.remove(directory / "tree"));
  EXPECT_FALSE(files.remove(directory / "tree"));
  EXPECT_FALSE(files.remove(directory / "missing/file"));
  EXPECT_EQ(listTree(directory.path()), "kept/\nkept/file\n");
}

// Links

TEST_F(PosixFilePlacementTest, ALinkIsASecondNameOfTheSameFile) {
  writeFile(directory / "a", "content");
  EXPECT_FALSE(files.link(directory / "a", directory / "b"));
  EXPECT_EQ(fs::hard_link_count(directory / "b"), 2U);
}

TEST_F(PosixFilePlacementTest, ALinkNeverOverwrites) {
  writeFile(directory / "a", "new");
  writeFile(directory / "b", "old");
  fs::create_symlink("elsewhere", directory / "dangling");
  EXPECT_EQ(files.link(directory / "a", directory / "b"), std::errc::file_exists);
  EXPECT_EQ(files.link(directory / "a", directory / "dangling"), std::errc::file_exists);
  EXPECT_EQ(readFile(directory / "b"), "old");
}

TEST_F(PosixFilePlacementTest, ALinkToASymbolicLinkNamesTheSymbolicLink) {
  writeFile(directory / "secret", "content");
  fs::create_symlink("secret", directory / "a");
  EXPECT_FALSE(files.link(directory / "a", directory / "b"));
  EXPECT_TRUE(fs::is_symlink(directory / "b"));
  EXPECT_EQ(fs::hard_link_count(directory / "secret"), 1U);
}

TEST_F(PosixFilePlacementTest, ALinkOfNothingIsAnError) {
  EXPECT_EQ(files.link(directory / "a", directory / "b"), std::errc::no_such_file_or_directory);
}

TEST_F(PosixFilePlacementTest, ALinkThatTheKernelRefusesForAnotherReasonIsNoCopy) {
  fs::create_directory(directory / "dir");
  EXPECT_EQ(files.link(directory / "dir", directory / "dir2"), std::errc::operation_not_permitted);
  writeFile(directory / "a", "content");
  EXPECT_EQ(files.link(directory / "a", directory / "missing/b"), std::errc::no_such_file_or_directory);
  EXPECT_EQ(listTree(directory.path()), "a\ndir/\n");
}

class LinkAcrossFileSystemsTest : public PosixFilePlacementTest {
 protected:
  void SetUp() override {
    if (other.path.empty()) GTEST_SKIP() << other.missing;
  }
  OtherFileSystem other;
};

TEST_F(LinkAcrossFileSystemsTest, AFileGetsACopyWithItsModeAndTimes) {
  putLargeFile("a");
  const auto error = files.link(directory / "a", other / "b");
  EXPECT_FALSE(error) << error.message();
  expectLargeFile(other / "b");
  expectLargeFile(directory / "a");
  EXPECT_EQ(listTree(other.path), "b\n");
}

TEST_F(LinkAcrossFileSystemsTest, NothingIsOverwrittenOrFollowed) {
  writeFile(directory / "a", "new");
  writeFile(other / "taken", "old");
  fs::create_symlink("elsewhere", other / "dangling");
  EXPECT_EQ(files.link(directory / "a", other / "taken"), std::errc::file_exists);
  EXPECT_EQ(files.link(directory / "a", other / "dangling"), std::errc::file_exists);
  EXPECT_EQ(readFile(other / "taken"), "old");
  EXPECT_EQ(listTree(other.path), "dangling\ntaken\n");
}

TEST_F(LinkAcrossFileSystemsTest, WhatIsNoFileIsNotCopied) {
  writeFile(directory / "dir/below", "content");
  fs::create_symlink("dir/below", directory / "link");
  makeNamedPipe(directory / "pipe");
  EXPECT_TRUE(files.link(directory / "dir", other / "dir"));
  EXPECT_EQ(files.link(directory / "link", other / "link"), std::errc::cross_device_link);
  EXPECT_EQ(files.link(directory / "pipe", other / "pipe"), std::errc::cross_device_link);
  EXPECT_EQ(files.link(directory / "missing", other / "missing"), std::errc::no_such_file_or_directory);
  EXPECT_EQ(listTree(other.path), "");
}

TEST_F(LinkAcrossFileSystemsTest, ACopyThatDoesNotFitLeavesNoRemains) {
  const TinyFileSystem tiny(directory / "tiny");
  if (!tiny.missing.empty()) GTEST_SKIP() << tiny.missing;
  writeFile(directory / "a", std::string(200'000, 'x'));
  EXPECT_EQ(files.link(directory / "a", directory / "tiny/a"), std::errc::no_space_on_device);
  EXPECT_EQ(listTree(directory.path()), "a\ntiny/\n");
}

// Moves

TEST_F(PosixFilePlacementTest, AMoveRenamesFilesDirectoriesAndLinks) {
  writeFile(directory / "file", "content");
  writeFile(directory / "dir/below", "content");
  fs::create_symlink("file", directory / "link");
  EXPECT_FALSE(move("file", "file2"));
  EXPECT_FALSE(move("dir", "dir2"));
  EXPECT_FALSE(move("link", "link2"));
  EXPECT_EQ(listTree(directory.path()), "dir2/\ndir2/below\nfile2\nlink2\n");
}

TEST_F(PosixFilePlacementTest, AMoveOntoAnythingIsAnErrorAndChangesNothing) {
  writeFile(directory / "file", "new");
  writeFile(directory / "taken", "old");
  fs::create_directory(directory / "empty");
  fs::create_symlink("elsewhere", directory / "dangling");
  for (const char* target : {"taken", "empty", "dangling"}) {
    EXPECT_EQ(move("file", target), std::errc::file_exists) << target;
  }
  EXPECT_EQ(listTree(directory.path()), "dangling\nempty/\nfile\ntaken\n");
  EXPECT_EQ(readFile(directory / "taken"), "old");
}

TEST_F(PosixFilePlacementTest, AMoveOfNothingOrIntoNoDirectoryIsAnError) {
  EXPECT_EQ(move("missing", "b"), std::errc::no_such_file_or_directory);
  writeFile(directory / "file", "content");
  EXPECT_EQ(move("file", "no/such/directory"), std::errc::no_such_file_or_directory);
  EXPECT_EQ(readFile(directory / "file"), "content");
}

TEST_F(PosixFilePlacementTest, AFileSystemWithoutSuchARenameGetsTheSameInSteps) {
  writeFile(directory / "file", "content");
  writeFile(directory / "taken", "old");
  writeFile(directory / "dir/below", "content");
  fs::create_directory(directory / "empty");
  const auto inSteps = [&](const std::string& source, const std::string& target) {
    return renameNoReplaceInSteps(AT_FDCWD, directory / source, AT_FDCWD, directory / target);
  };
  EXPECT_EQ(inSteps("file", "taken"), std::errc::file_exists);
  EXPECT_EQ(inSteps("dir", "empty"), std::errc::file_exists);
  EXPECT_FALSE(inSteps("file", "file2"));
  EXPECT_FALSE(inSteps("dir", "dir2"));
  EXPECT_EQ(listTree(directory.path()), "dir2/\ndir2/below\nempty/\nfile2\ntaken\n");
  EXPECT_EQ(fs::hard_link_count(directory / "file2"), 1U);
}

class MoveAcrossFileSystemsTest : public PosixFilePlacementTest {
 protected:
  void SetUp() override {
    if (other.path.empty()) GTEST_SKIP() << other.missing;
  }
  OtherFileSystem other;
};

TEST_F(MoveAcrossFileSystemsTest, AFileArrivesWholeWithModeAndTime) {
  putLargeFile("a");
  const auto error = files.move(directory / "a", other / "b");
  EXPECT_FALSE(error) << error.message();
  expectLargeFile(other / "b");
  EXPECT_EQ(listTree(directory.path()), "");
  EXPECT_EQ(listTree(other.path), "b\n");
}

TEST_F(MoveAcrossFileSystemsTest, ARenameSaysThatItIsNoneAndCopiesNothing) {
  putLargeFile("a");
  EXPECT_EQ(files.rename(directory / "a", other / "b"), std::errc::cross_device_link);
  EXPECT_EQ(listTree(other.path), "");
  EXPECT_FALSE(files.rename(directory / "a", directory / "b"));
  expectLargeFile(directory / "b");
}

TEST_F(MoveAcrossFileSystemsTest, ADirectoryArrivesWithAllBelowIt) {
  writeFile(directory / "a/deep/file", "content");
  fs::create_symlink("deep", directory / "a/link");
  EXPECT_FALSE(files.move(directory / "a", other / "b"));
  EXPECT_EQ(listTree(other.path), "b/\nb/deep/\nb/deep/file\nb/link\n");
  EXPECT_EQ(listTree(directory.path()), "");
}

TEST_F(MoveAcrossFileSystemsTest, ASymbolicLinkArrivesAsALink) {
  writeFile(directory / "secret", "content");
  fs::create_symlink("secret", directory / "a");
  EXPECT_FALSE(files.move(directory / "a", other / "b"));
  EXPECT_EQ(fs::read_symlink(other / "b"), "secret");
  EXPECT_EQ(listTree(directory.path()), "secret\n");
}

TEST_F(MoveAcrossFileSystemsTest, ACopyIsMadeInTheTemporaryAreaWhereThatIsOnTheTargetsFileSystem) {
  PosixFilePlacement near{directory / "home", other / "area"};
  putLargeFile("a");
  writeFile(directory / "d/file", "content");
  EXPECT_FALSE(near.move(directory / "a", other / "b"));
  EXPECT_FALSE(near.move(directory / "d", other / "e"));
  expectLargeFile(other / "b");
  EXPECT_EQ(listTree(other.path), "area/\nb\ne/\ne/file\n");
  EXPECT_EQ(listTree(directory.path()), "");
}

TEST_F(MoveAcrossFileSystemsTest, WhatAKillLeavesOfACopyIsFoundByTheNextStart) {
  putLargeFile("a");
  ::chmod((directory / "a").c_str(), 0404);
  const pid_t process = ::fork();
  if (process == 0) {
    PosixFilePlacement dying{directory / "home", other / "area"};
    int renames = 0;
    const bool canDie =
        withFailingCalls({{.number = SYS_renameat2,
                           .ofThose =
                               [&renames](const std::uint64_t*) {
                                 // The first one finds that there are two file systems.
                                 if (++renames == 2) ::raise(SIGKILL);
                                 return false;
                               }}},
                         [&] { static_cast<void>(dying.move(directory / "a", other / "b")); });
    ::_exit(canDie ? 0 : 77);
  }
  int status = 0;
  ASSERT_EQ(::waitpid(process, &status, 0), process);
  if (WIFEXITED(status) && WEXITSTATUS(status) == 77) GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_TRUE(WIFSIGNALED(status)) << status;
  EXPECT_FALSE(fs::exists(other / "b"));
  EXPECT_EQ(removeTemporaryLeftovers(other / "area", std::chrono::floor<std::chrono::microseconds>(
                                                         std::chrono::system_clock::now())),
            1U);
  EXPECT_EQ(listTree(other.path), "");
  EXPECT_EQ(readFile(directory / "a"), std::string(300'000, 'x'));
}

TEST_F(MoveAcrossFileSystemsTest, ATakenTargetIsAnErrorAndChangesNothing) {
  writeFile(directory / "a", "new");
  writeFile(other / "taken", "old");
  fs::create_symlink("elsewhere", other / "dangling");
  EXPECT_EQ(files.move(directory / "a", other / "taken"), std::errc::file_exists);
  EXPECT_EQ(files.move(directory / "a", other / "dangling"), std::errc::file_exists);
  EXPECT_EQ(readFile(other / "taken"), "old");
  EXPECT_EQ(readFile(directory / "a"), "new");
  EXPECT_EQ(listTree(other.path), "dangling\ntaken\n");
}

TEST_F(MoveAcrossFileSystemsTest, WhatCannotBeTakenAlongStaysWhereItIs) {
  writeFile(directory / "a/file", "content");
  makeNamedPipe(directory / "a/pipe");
  EXPECT_EQ(files.move(directory / "a", other / "b"), std::errc::operation_not_supported);
  EXPECT_EQ(files.move(directory / "a/pipe", other / "b"), std::errc::operation_not_supported);
  EXPECT_EQ(listTree(directory.path()), "a/\na/file\na/pipe\n");
  EXPECT_EQ(listTree(other.path), "");
}

TEST_F(MoveAcrossFileSystemsTest, AFullTargetLeavesTheSourceAndNoRemains) {
  const TinyFileSystem tiny(directory / "tiny");
  if (!tiny.missing.empty()) GTEST_SKIP() << tiny.missing;
  writeFile(directory / "a", std::string(200'000, 'x'));
  writeFile(directory / "d/1", "small");
  writeFile(directory / "d/2", std::string(200'000, 'x'));
  EXPECT_EQ(move("a", "tiny/a"), std::errc::no_space_on_device);
  EXPECT_EQ(move("d", "tiny/d"), std::errc::no_space_on_device);
  EXPECT_EQ(listTree(directory.path()), "a\nd/\nd/1\nd/2\ntiny/\n");
  EXPECT_EQ(fs::file_size(directory / "a"), 200'000U);
}

// Names

TEST_F(PosixFilePlacementTest, AFreeNameIsTheUniqueName) { EXPECT_EQ(uniqueName("new.log"), "new.log"); }

TEST_F(PosixFilePlacementTest, ATakenNameGetsTheFirstFreeNumberBeforeItsExtension) {
  writeFile(directory / "a.log", "");
  EXPECT_EQ(uniqueName("a.log"), "a-2.log");
  writeFile(directory / "a-2.log", "");
  fs::create_symlink("elsewhere", directory / "a-3.log");  // taken, though it leads nowhere
  EXPECT_EQ(uniqueName("a.log"), "a-4.log");
}

TEST_F(PosixFilePlacementTest, NamesOfEveryShapeGetTheirNumber) {
  for (const char* name : {"plain", ".hidden", "a.tar.gz", "dir.d/plain"}) writeFile(directory / name, "");
  EXPECT_EQ(uniqueName("plain"), "plain-2");
  EXPECT_EQ(uniqueName(".hidden"), ".hidden-2");
  EXPECT_EQ(uniqueName("a.tar.gz"), "a.tar-2.gz");
  EXPECT_EQ(uniqueName("dir.d/plain"), "dir.d/plain-2");
  EXPECT_EQ(uniqueName("dir.d"), "dir-2.d");
}

TEST_F(PosixFilePlacementTest, ANameThatCannotExistHasNoUniqueName) {
  EXPECT_EQ(uniqueName(std::string(300, 'x')), "(none)");
}

TEST_F(PosixFilePlacementTest, ANameWhoseNumberedFormsAreTooLongHasNoUniqueName) {
  const std::string name(255, 'x');
  writeFile(directory / name, "");
  EXPECT_EQ(uniqueName(name), "(none)");
}

/// Who finds no name for a file removes it.
TEST_F(PosixFilePlacementTest, ANameThatCannotBeLookedAtIsLeftToTheMoveWhichKeepsTheFile) {
  writeFile(directory / "a", "content");
  fs::create_symlink("loop", directory / "loop");
  EXPECT_EQ(uniqueName("loop/a"), "loop/a");
  EXPECT_EQ(move("a", "loop/a"), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(readFile(directory / "a"), "content");
}

TEST_F(PosixFilePlacementTest, TheSearchForAFreeNameEnds) {
  writeFile(directory / "a", "");
  for (int number = 2; number <= 10'000; ++number) {
    fs::create_symlink("x", directory / "a-" + std::to_string(number));
  }
  EXPECT_EQ(uniqueName("a"), "(none)");
  fs::remove(directory / "a-10000");
  EXPECT_EQ(uniqueName("a"), "a-10000");
}

// Temporary paths

TEST_F(PosixFilePlacementTest, TemporaryPathsNameNothingAndCannotBeGuessed) {
  std::set<std::string> paths;
  for (int i = 0; i < 100; ++i) paths.insert(files.randomTemporaryPath(".zip"));
  EXPECT_EQ(paths.size(), 100U);
  const std::string path = *paths.begin();
  const std::string prefix = directory / "temporary/";
  EXPECT_TRUE(path.starts_with(prefix) && path.ends_with(".zip")) << path;
  EXPECT_EQ(path.size(), prefix.size() + 32 + 4);  // 128 bits, 4 to a digit
  EXPECT_FALSE(fs::exists(path));
}

TEST_F(PosixFilePlacementTest, TheTemporaryAreaIsMadeForThisUserAlone) {
  EXPECT_FALSE(fs::exists(directory / "temporary"));
  (void)files.randomTemporaryPath("");
  EXPECT_EQ(modeAndTime(directory / "temporary").substr(0, 4), "700 ");
}

TEST_F(PosixFilePlacementTest, ATemporaryAreaOpenToOthersIsClosed) {
  fs::create_directory(directory / "temporary");
  ::chmod((directory / "temporary").c_str(), 0777);
  (void)files.randomTemporaryPath("");
  EXPECT_EQ(modeAndTime(directory / "temporary").substr(0, 4), "700 ");
}

TEST_F(PosixFilePlacementTest, ATemporaryAreaThatSomebodyPreparedIsNotUsed) {
  fs::create_directory(directory / "trap");
  fs::create_directory_symlink("trap", directory / "temporary");
  const std::string path = files.randomTemporaryPath("");
  const std::string area = fs::path(path).parent_path();
  EXPECT_TRUE(area.starts_with(directory / "temporary-")) << area;
  EXPECT_EQ(modeAndTime(area).substr(0, 4), "700 ");
  writeFile(path, "works");
  EXPECT_EQ(listTree(directory / "trap"), "");
}

}  // namespace
}  // namespace zal::testing
