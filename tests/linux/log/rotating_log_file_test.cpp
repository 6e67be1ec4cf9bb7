#include "platform/linux/log/rotating_log_file.h"

#include <sys/mount.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/log/record_text.h"
#include "tests/support/file_size_limit.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::listTree;
using testing::readFile;
using testing::TemporaryDirectory;
using testing::writeFile;

class RotatingLogFileTest : public ::testing::Test {
 protected:
  void open() {
    file = std::make_unique<RotatingLogFile>(RotatingLogFile::Place{root, "Vistel", "Vistel.log"}, 1000,
                                             messages);
  }
  void add(const std::string& record) {
    file->beginRecord() += record;
    file->endRecord();
  }
  void fillUpTo(std::size_t bytes) {
    const std::string record(1023, 'x');
    while (file->bufferedBytes() < bytes) add(record + "\n");
  }
  [[nodiscard]] std::string content() const { return readFile(path); }

  TemporaryDirectory directory;
  const std::string root = directory / "Logs";
  const std::string path = directory / "Logs/Vistel/Vistel.log";
  std::vector<std::string> messages;
  std::unique_ptr<RotatingLogFile> file;
};

TEST_F(RotatingLogFileTest, MakesItsDirectoriesForItsGroup) {
  const mode_t oldMask = ::umask(0);
  open();
  ::umask(oldMask);
  struct stat status {};
  ASSERT_EQ(::stat(path.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0640U);
  ASSERT_EQ(::stat((root + "/Vistel").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0770U);
}

TEST_F(RotatingLogFileTest, RecordsAreAppendedAtTheFlush) {
  writeFile(path, "old\n");
  open();
  add("one\n");
  add("two\n");
  EXPECT_EQ(content(), "old\n");
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "old\none\ntwo\n");
  EXPECT_TRUE(file->flush());
  EXPECT_THAT(messages, IsEmpty());
}

TEST_F(RotatingLogFileTest, ALineThatAKilledAgentLeftWithoutItsEndIsEnded) {
  writeFile(path, "old\nto");
  open();
  add("one\n");
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "old\nto\none\n");
}

TEST_F(RotatingLogFileTest, ClosedItOpensAgainAndLosesNothing) {
  open();
  add("one\n");
  file->close();
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "one\n");
}

TEST_F(RotatingLogFileTest, RotationIsDueWhenFileAndBufferReachTheSize) {
  open();
  add(std::string(400, 'a') + "\n");
  EXPECT_TRUE(file->flush());
  add(std::string(597, 'b') + "\n");
  EXPECT_FALSE(file->isRotationDue());  // 999 bytes
  add("\n");
  EXPECT_TRUE(file->isRotationDue());  // 1000 bytes
}

TEST_F(RotatingLogFileTest, AnOldFileThatIsTooLargeIsDueAtOnce) {
  writeFile(path, std::string(1000, '\n'));
  open();
  EXPECT_TRUE(file->isRotationDue());
}

TEST_F(RotatingLogFileTest, RotatedAwayItBeginsAnew) {
  open();
  add("one\n");
  EXPECT_TRUE(file->flush());
  std::uint64_t sequence = 7;
  EXPECT_TRUE(file->rotateAway(sequence));
  add("two\n");
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(sequence, 7U);
  EXPECT_EQ(readFile(path + ".pending-7"), "one\n");
  EXPECT_EQ(content(), "two\n");
}

TEST_F(RotatingLogFileTest, AWaitingFileIsNeverOverwritten) {
  open();
  writeFile(path + ".pending-7", "another agent's");
  std::uint64_t sequence = 7;
  EXPECT_TRUE(file->rotateAway(sequence));
  EXPECT_EQ(sequence, 8U);
  EXPECT_EQ(readFile(path + ".pending-7"), "another agent's");
}

TEST_F(RotatingLogFileTest, AFileThatWasTakenAwayIsMadeAgain) {
  open();
  add("one\n");
  EXPECT_TRUE(file->flush());
  std::filesystem::remove_all(root);
  add("two\n");
  file->leaveIfReplaced();
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "two\n");
  std::filesystem::rename(path, path + ".moved");
  add("three\n");
  file->leaveIfReplaced();
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "three\n");
  EXPECT_EQ(readFile(path + ".moved"), "two\n");
  EXPECT_THAT(messages, IsEmpty());
}

TEST_F(RotatingLogFileTest, AFullDiskIsSaidOnceAndTheRecordsAreKept) {
  open();
  add("one\n");
  {
    const testing::FileSizeLimit full(0);
    EXPECT_FALSE(file->flush());
    add("two\n");
    EXPECT_FALSE(file->flush());
  }
  EXPECT_THAT(messages, ElementsAre(path + ": cannot be written: File too large; up to 4 MiB of "
                                           "records are kept until it can"));
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "one\ntwo\n");
  ASSERT_EQ(messages.size(), 2U);
  EXPECT_EQ(messages[1], path + ": is written again; 0 records were dropped");
  EXPECT_FALSE(file->isInOutage());
}

TEST_F(RotatingLogFileTest, ALinkInThePlaceOfTheDirectoryOrTheFileIsNotFollowed) {
  const std::string victim = directory / "elsewhere/Vistel.log";
  writeFile(victim, "untouched\n");
  std::filesystem::create_directories(root);
  std::filesystem::create_directory_symlink(directory / "elsewhere", root + "/Vistel");
  open();
  add("one\n");
  EXPECT_FALSE(file->flush());
  EXPECT_THAT(messages,
              ElementsAre(path + ": cannot be written: Too many levels of symbolic links; up to 4 MiB "
                                 "of records are kept until it can"));
  std::filesystem::remove(root + "/Vistel");
  std::filesystem::create_directories(root + "/Vistel");
  std::filesystem::create_symlink(victim, path);
  EXPECT_FALSE(file->flush());
  std::filesystem::remove(path);
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "one\n");
  EXPECT_EQ(listTree(directory / "elsewhere"), "Vistel.log\n");
  EXPECT_EQ(readFile(victim), "untouched\n");
}

TEST_F(RotatingLogFileTest, AFileThatALinkReplacesIsLeft) {
  open();
  add("one\n");
  EXPECT_TRUE(file->flush());
  std::filesystem::rename(path, directory / "moved");
  std::filesystem::create_symlink(directory / "moved", path);
  file->leaveIfReplaced();
  add("two\n");
  EXPECT_FALSE(file->flush());
  EXPECT_EQ(readFile(directory / "moved"), "one\n");
}

TEST_F(RotatingLogFileTest, ARootThatIsALinkIsAsGood) {
  std::filesystem::create_directories(directory / "elsewhere");
  std::filesystem::create_directory_symlink("elsewhere", root);
  open();
  add("one\n");
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(readFile(directory / "elsewhere/Vistel/Vistel.log"), "one\n");
}

TEST_F(RotatingLogFileTest, ADirectoryThatCannotBeMadeIsAnOutageToo) {
  writeFile(root, "in the way");
  open();
  add("one\n");
  EXPECT_FALSE(file->flush());
  EXPECT_THAT(messages, ElementsAre(path + ": cannot be written: Not a directory; up to 4 MiB of records are "
                                           "kept until it can"));
  std::filesystem::remove(root);
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content(), "one\n");
}

TEST_F(RotatingLogFileTest, WhatIsKeptIsBoundedAndTheRestIsCounted) {
  writeFile(root, "in the way");
  open();
  fillUpTo(RotatingLogFile::kLargestBacklog);
  EXPECT_EQ(file->bufferedBytes(), 4U << 20U);
  add("beyond\n");
  add("beyond\n    | still\n");
  EXPECT_EQ(file->bufferedBytes(), 4U << 20U);
  std::filesystem::remove(root);
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(content().size(), 4U << 20U);
  EXPECT_EQ(messages.back(), path + ": is written again; 2 records were dropped");
}

TEST_F(RotatingLogFileTest, WhatWasBufferedBeyondTheBoundWhenTheOutageBeginsIsDroppedWholeRecordByRecord) {
  open();
  fillUpTo((4U << 20U) - 1024);
  add(std::string(1020, 'y') + "\n    | more\n");
  add("2 beyond\n    | more\n");
  add("3 beyond\n");
  std::filesystem::remove_all(root);
  writeFile(root, "in the way");
  file->leaveIfReplaced();
  EXPECT_FALSE(file->flush());
  std::filesystem::remove(root);
  EXPECT_TRUE(file->flush());
  EXPECT_EQ(messages.back(), path + ": is written again; 2 records were dropped");
  EXPECT_TRUE(content().ends_with("y\n    | more\n"));
}

/// A file system that fills up in the middle of a record.
class SmallDiskTest : public RotatingLogFileTest {
 protected:
  void SetUp() override {
    std::filesystem::create_directories(root);
    if (::mount("tmpfs", root.c_str(), "tmpfs", 0, "size=64k") != 0) {
      GTEST_SKIP() << "no small file system can be mounted here: " << std::strerror(errno);
    }
    _isMounted = true;
    open();
  }
  void TearDown() override {
    file.reset();
    if (_isMounted) ::umount2(root.c_str(), MNT_DETACH);
  }
  void addNumbered(int from, int to) {
    for (int number = from; number < to; ++number) {
      const std::string record = "record " + std::to_string(number) + " " + std::string(50, 'x') + "\n";
      expected += record;
      add(record);
    }
  }
  std::string expected;

 private:
  bool _isMounted = false;
};

TEST_F(SmallDiskTest, ARecordThatIsHalfWrittenIsEndedOnceThereIsRoom) {
  writeFile(root + "/ballast", std::string(40'000, 'b'));
  addNumbered(0, 1000);
  EXPECT_FALSE(file->flush());
  const std::size_t written = content().size();
  EXPECT_GT(written, 0U);
  EXPECT_NE(content().back(), '\n') << "the disk happened to fill at the end of a record";
  addNumbered(1000, 1001);
  file->close();
  std::filesystem::resize_file(root + "/ballast", 0);
  EXPECT_EQ(::mount("tmpfs", root.c_str(), "tmpfs", MS_REMOUNT, "size=1m"), 0);
  EXPECT_TRUE(file->flush());
  EXPECT_TRUE(content() == expected);
  EXPECT_EQ(messages.size(), 2U);
}

TEST_F(SmallDiskTest, TheRestOfARecordWhoseFileIsGoneIsDropped) {
  addNumbered(0, 2000);
  EXPECT_FALSE(file->flush());
  ASSERT_NE(content().back(), '\n') << "the disk happened to fill at the end of a record";
  const std::size_t lastWhole = content().rfind('\n') + 1;
  std::filesystem::remove(path);
  EXPECT_EQ(::mount("tmpfs", root.c_str(), "tmpfs", MS_REMOUNT, "size=1m"), 0);
  EXPECT_TRUE(file->flush());
  EXPECT_TRUE(content() == expected.substr(expected.find('\n', lastWhole) + 1));
  EXPECT_EQ(messages.back(), path + ": is written again; 1 records were dropped");
}

}  // namespace
}  // namespace zal
