#include "platform/linux/files/unfinished_files.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "platform/linux/files/changed_at.h"
#include "platform/linux/files/whole_file.h"
#include "tests/support/real_places.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// One that ran, and has no number any more.
pid_t processThatIsGone() {
  const pid_t process = ::fork();
  if (process == 0) ::_exit(0);
  ::waitpid(process, nullptr, 0);
  return process;
}

class UnfinishedFilesTest : public ::testing::Test {
 protected:
  std::string put(const std::string& name) {
    writeFile(directory / name, "half");
    setTime(directory / name, kSeconds, 0);
    return name;
  }
  std::size_t remove(std::chrono::seconds later = {}) {
    return removeUnfinishedFiles(directory.path(), WallTime{std::chrono::seconds{kSeconds} + later});
  }
  static constexpr long kSeconds = 1'714'651'388;
  const TemporaryDirectory directory;
};

TEST_F(UnfinishedFilesTest, WhatAProcessLeftThatIsGoneGoesAndThatOfALivingOneStays) {
  put(".new-" + std::to_string(processThatIsGone()) + "-1");
  const std::string own = put(".new-" + std::to_string(::getpid()) + "-7");
  EXPECT_EQ(remove(std::chrono::hours{1}), 1U);
  EXPECT_EQ(listTree(directory.path()), own + "\n");
}

TEST_F(UnfinishedFilesTest, OfNobodysItGoesAfterAMinuteInEitherDirection) {
  for (const std::string name :
       {".post-a1", ".new-", ".new-x-1", ".new-0-1", ".new--5-1", ".new-99999999999-1"}) {
    put(name);
    EXPECT_EQ(remove(std::chrono::seconds{60}), 0U) << name;
    EXPECT_EQ(remove(std::chrono::seconds{61}), 1U) << name;
    put(name);
    EXPECT_EQ(remove(std::chrono::seconds{-61}), 1U) << name;
  }
}

TEST_F(UnfinishedFilesTest, WholeFilesDirectoriesAndLinksStay) {
  const std::string gone = ".new-" + std::to_string(processThatIsGone());
  put("shares");
  std::filesystem::create_directory(directory / (gone + "-1"));
  std::filesystem::create_symlink("shares", directory / (gone + "-2"));
  EXPECT_EQ(remove(std::chrono::hours{1}), 0U);
  EXPECT_EQ(removeUnfinishedFiles(directory / "absent", {}), 0U);
}

TEST_F(UnfinishedFilesTest, AFileThatIsPlacedWholeLeavesNothing) {
  EXPECT_FALSE(placeWholeFile(directory / "a", "text", ExistingFile::isReplaced));
  EXPECT_EQ(placeWholeFile(directory / "a", "other", ExistingFile::stays), std::errc::file_exists);
  EXPECT_EQ(listTree(directory.path()), "a\n");
}

}  // namespace
}  // namespace zal::testing
