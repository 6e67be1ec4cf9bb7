#include "platform/linux/log/log_rotation.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>

#include <cerrno>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/log/rotation_names.h"
#include "platform/linux/log/zip_file.h"
#include "tests/linux/log/unzipped.h"
#include "tests/support/failing_calls.h"
#include "tests/support/file_size_limit.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::listTree;
using testing::readFile;
using testing::TemporaryDirectory;
using testing::unzipped;
using testing::writeFile;

constexpr const char* kFile = "Vistel.log";

class LogRotationTest : public ::testing::Test {
 protected:
  [[nodiscard]] std::string path(const std::string& name) const { return set + "/" + name; }
  void pending(std::uint64_t sequence, const std::string& text) {
    writeFile(path(pendingName(kFile, sequence)), text);
  }
  void zip(const std::string& name, const std::string& text) {
    writeFile(root / "content", text);
    std::filesystem::create_directories(set);
    ASSERT_EQ(packIntoZip(AT_FDCWD, root / "content", path(name), kFile), std::error_code{});
    std::filesystem::remove(root / "content");
  }
  void ready(std::uint64_t sequence, const std::string& text) { zip(readyName(kFile, sequence), text); }
  void generation(int number, const std::string& text) { zip(generationName(kFile, number), text); }
  std::error_code complete() const { return completeRotations({set, kFile}); }
  /// The generations that there are, newest first, as "1=text 2=text ".
  [[nodiscard]] std::string generations() const {
    std::string found;
    for (int number = 1; number <= 20; ++number) {
      const std::string file = path(generationName(kFile, number));
      if (std::filesystem::exists(file)) found += std::to_string(number) + "=" + unzipped(file) + " ";
    }
    return found;
  }
  /// Whatever is in the set's directory besides generations.
  [[nodiscard]] std::string others() const {
    std::string names;
    for (const auto& entry : std::filesystem::directory_iterator(set)) {
      const std::string name = entry.path().filename().string();
      bool isGeneration = false;
      for (int number = 1; number <= 9; ++number) isGeneration |= name == generationName(kFile, number);
      if (!isGeneration) names += name + " ";
    }
    return names;
  }
  void nineGenerations() {
    for (int number = 1; number <= 9; ++number) generation(number, "g" + std::to_string(number));
  }

  TemporaryDirectory root;
  const std::string set = root / "Vistel";
};

TEST_F(LogRotationTest, TheFirstRotationMakesTheFirstGeneration) {
  pending(1, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(listTree(set), "Vistel.log.1.zip\n");
  EXPECT_EQ(generations(), "1=new ");
}

TEST_F(LogRotationTest, TheArchivesEntryIsNamedLikeTheLog) {
  pending(1, "new");
  EXPECT_EQ(complete(), std::error_code{});
  const auto status = std::filesystem::status(path("Vistel.log.1.zip"));
  EXPECT_EQ(status.permissions() & ~std::filesystem::perms(0640), std::filesystem::perms(0));
  ASSERT_EQ(std::system(("cd '" + root.path() + "' && unzip -q Vistel/Vistel.log.1.zip").c_str()), 0);
  EXPECT_EQ(readFile(root / "Vistel.log"), "new");
}

TEST_F(LogRotationTest, OlderGenerationsMoveUpAndTheTenthGoes) {
  nineGenerations();
  pending(5, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 3=g2 4=g3 5=g4 6=g5 7=g6 8=g7 9=g8 ");
  EXPECT_EQ(others(), "");
}

TEST_F(LogRotationTest, WithFewerThanNineNothingGoes) {
  generation(1, "g1");
  generation(2, "g2");
  pending(5, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 3=g2 ");
}

TEST_F(LogRotationTest, CutOffWhileCompressing) {
  generation(1, "g1");
  pending(5, "new");
  writeFile(path("Vistel.log.zip.tmp"), "half an archive");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 ");
  EXPECT_EQ(others(), "");
}

TEST_F(LogRotationTest, CutOffBeforeThePendingFileWasRemoved) {
  generation(1, "g1");
  pending(5, "new");
  ready(5, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 ");
  EXPECT_EQ(others(), "");
}

TEST_F(LogRotationTest, CutOffBeforeTheShift) {
  nineGenerations();
  ready(5, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 3=g2 4=g3 5=g4 6=g5 7=g6 8=g7 9=g8 ");
  EXPECT_EQ(others(), "");
}

TEST_F(LogRotationTest, CutOffAtAnyPointOfTheShift) {
  for (int moved = 1; moved <= 8; ++moved) {
    SCOPED_TRACE(moved);
    std::filesystem::remove_all(set);
    // So many moves were made, from the ninth place down: the next place is free.
    for (int number = 1; number <= 9; ++number) {
      if (number == 9 - moved) continue;
      generation(number, "g" + std::to_string(number > 9 - moved ? number - 1 : number));
    }
    ready(5, "new");
    EXPECT_EQ(complete(), std::error_code{});
    EXPECT_EQ(generations(), "1=new 2=g1 3=g2 4=g3 5=g4 6=g5 7=g6 8=g7 9=g8 ");
    EXPECT_EQ(others(), "");
  }
}

TEST_F(LogRotationTest, CutOffAfterTheLastRename) {
  generation(1, "new");
  generation(2, "g1");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 ");
}

TEST_F(LogRotationTest, SeveralWaitingFilesKeepTheirOrderByNumber) {
  generation(1, "g1");
  pending(10, "third");
  ready(8, "first");
  pending(9, "second");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=third 2=second 3=first 4=g1 ");
}

TEST_F(LogRotationTest, AGapInTheGenerationsIsFilledAndNothingBeyondItMoves) {
  generation(1, "g1");
  generation(3, "g3");
  pending(5, "new");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 3=g3 ");
}

TEST_F(LogRotationTest, OfAFloodTheNewestNineAreKept) {
  generation(1, "old");
  for (std::uint64_t i = 1; i <= 12; ++i) pending(i, "p" + std::to_string(i));
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=p12 2=p11 3=p10 4=p9 5=p8 6=p7 7=p6 8=p5 9=p4 ");
  EXPECT_EQ(others(), "");
}

TEST_F(LogRotationTest, OtherFilesAreLeftAlone) {
  pending(1, "new");
  writeFile(path("Vistel.log"), "current");
  writeFile(path("Vistel-Event.log.pending-2"), "event");
  writeFile(path("Vistel-Event.log.zip.tmp"), "half");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(listTree(set),
            "Vistel-Event.log.pending-2\nVistel-Event.log.zip.tmp\nVistel.log\nVistel.log.1.zip\n");
}

TEST_F(LogRotationTest, WhatCannotBeReadStopsItAndALaterRunGoesOn) {
  std::filesystem::create_directories(path(pendingName(kFile, 1)));
  pending(2, "new");
  EXPECT_NE(complete(), std::error_code{});
  EXPECT_EQ(generations(), "");
  std::filesystem::remove(path(pendingName(kFile, 1)));
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new ");
}

TEST_F(LogRotationTest, AMissingDirectoryIsReturned) {
  EXPECT_EQ(complete(), std::errc::no_such_file_or_directory);
}

TEST_F(LogRotationTest, ACompressionThatTheDiskRefusesLeavesThePendingFile) {
  pending(1, "new");
  std::filesystem::create_directories(path("Vistel.log.zip.tmp/in the way"));
  EXPECT_NE(complete(), std::error_code{});
  EXPECT_EQ(readFile(path("Vistel.log.pending-1")), "new");
}

TEST_F(LogRotationTest, AGenerationThatCannotBeLookedAtIsNotWrittenOver) {
  generation(1, "g1");
  pending(5, "new");
  std::error_code error;
  if (!testing::withFailingCalls({{SYS_newfstatat, EIO, 1, testing::namesPath("Vistel.log.1.zip")}},
                                 [&] { error = complete(); }))
    GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_EQ(error, std::errc::io_error);
  EXPECT_EQ(generations(), "1=g1 ");
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=new 2=g1 ");
}

TEST_F(LogRotationTest, UnfinishedRotationsOfAllSetsAreFound) {
  writeFile(root / "A/A.log.pending-3", "");
  writeFile(root / "A/A.log.pending-4", "");
  writeFile(root / "A/A-Event.log.ready-12.zip", "");
  writeFile(root / "B/B.log.zip.tmp", "");
  writeFile(root / "C/C.log", "");
  writeFile(root / "C/D.log.pending-90", "");
  writeFile(root / "E.log.pending-91", "");
  const auto found = findUnfinishedRotations(root.path());
  EXPECT_THAT(found.files,
              ElementsAre(UnfinishedRotation{root / "A", "A-Event.log"},
                          UnfinishedRotation{root / "A", "A.log"}, UnfinishedRotation{root / "B", "B.log"}));
  EXPECT_EQ(found.highestSequence, 12U);
}

TEST_F(LogRotationTest, AMissingRootHasNoUnfinishedRotations) {
  EXPECT_THAT(findUnfinishedRotations(root / "missing").files, IsEmpty());
}

TEST(ZipFileTest, ALargeFileComesBackByteForByte) {
  const TemporaryDirectory directory;
  std::string text;
  for (int i = 0; i < 60'000; ++i) text += "record " + std::to_string(i * 7919) + "\n";
  writeFile(directory / "source", text);
  EXPECT_EQ(packIntoZip(AT_FDCWD, directory / "source", directory / "a.zip", "source.log"),
            std::error_code{});
  EXPECT_TRUE(unzipped(directory / "a.zip") == text);
  EXPECT_LT(std::filesystem::file_size(directory / "a.zip"), text.size() / 2);
}

TEST_F(LogRotationTest, ALinkInThePlaceOfTheSetIsNotFollowed) {
  std::filesystem::create_directories(root / "elsewhere");
  writeFile(root / ("elsewhere/" + pendingName(kFile, 1)), "theirs\n");
  std::filesystem::create_directory_symlink("elsewhere", set);
  EXPECT_THAT(findUnfinishedRotations(root.path()).files, IsEmpty());
  EXPECT_EQ(complete(), std::errc::too_many_symbolic_link_levels);
  EXPECT_EQ(listTree(root / "elsewhere"), pendingName(kFile, 1) + "\n");
}

TEST_F(LogRotationTest, ALinkThatWaitsIsNotPackedAndOneAtTheZipsNameLosesIt) {
  writeFile(root / "theirs", "theirs");
  std::filesystem::create_directories(set);
  std::filesystem::create_symlink(root / "theirs", path(pendingName(kFile, 1)));
  EXPECT_EQ(complete(), std::errc::too_many_symbolic_link_levels);
  std::filesystem::remove(path(pendingName(kFile, 1)));
  pending(2, "ours");
  std::filesystem::create_symlink(root / "theirs", path(unfinishedZipName(kFile)));
  EXPECT_EQ(complete(), std::error_code{});
  EXPECT_EQ(generations(), "1=ours ");
  EXPECT_EQ(readFile(root / "theirs"), "theirs");
}

TEST(ZipFileTest, FailureIsReturnedAndLeavesNoArchive) {
  const TemporaryDirectory directory;
  EXPECT_EQ(packIntoZip(AT_FDCWD, directory / "missing", directory / "a.zip", "x.log"),
            std::errc::no_such_file_or_directory);
  writeFile(directory / "source", std::string(300'000, 'x'));
  EXPECT_EQ(packIntoZip(AT_FDCWD, directory / "source", directory / "no/a.zip", "x.log"),
            std::errc::no_such_file_or_directory);
  EXPECT_EQ(listTree(directory.path()), "source\n");
}

TEST(ZipFileTest, AFullDiskIsReturned) {
  const TemporaryDirectory directory;
  writeFile(directory / "source", std::string(300'000, 'x'));
  const testing::FileSizeLimit limit(100);
  EXPECT_NE(packIntoZip(AT_FDCWD, directory / "source", directory / "a.zip", "x.log"), std::error_code{});
  EXPECT_EQ(listTree(directory.path()), "source\n");
}

}  // namespace
}  // namespace zal
