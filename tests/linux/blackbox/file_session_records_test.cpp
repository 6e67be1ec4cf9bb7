#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <stdexcept>

#include "platform/linux/blackbox/file_session_records.h"
#include "tests/support/failing_calls.h"
#include "tests/support/fake_services.h"
#include "tests/support/file_size_limit.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/process_size.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::StartsWith;
using Pieces = std::vector<std::string>;

/// A black box in a directory that does not exist yet. Another object is another process: the lock is on
/// the open file.
class FileSessionRecordsTest : public ::testing::Test {
 protected:
  [[nodiscard]] std::unique_ptr<FileSessionRecords> makeRecords() {
    return std::make_unique<FileSessionRecords>(loop, log, directory, settings);
  }
  [[nodiscard]] std::vector<std::string> files() const {
    std::vector<std::string> names;
    std::error_code none;
    for (const auto& entry : std::filesystem::directory_iterator(directory, none))
      names.push_back(entry.path());
    return names;
  }
  [[nodiscard]] std::vector<std::string> endings() const {
    std::vector<std::string> result;
    for (const std::string& file : files()) result.push_back(file.substr(directory.size() + 1 + 32));
    return result;
  }
  /// What the next start finds.
  std::vector<Pieces> recovered(bool isServed = true) {
    std::vector<Pieces> found;
    makeRecords()->recover([&](const UnfinishedRecord& record) {
      Pieces& pieces = found.emplace_back();
      unreadable = record.read([&pieces](std::string_view piece) { pieces.emplace_back(piece); });
      return isServed;
    });
    return found;
  }
  /// A record that its process left behind.
  void leave(const Pieces& pieces) {
    const auto record = records->begin();
    for (const std::string& piece : pieces) record->append(piece);
  }

  testing::ManualRunLoop loop;
  testing::RecordingAgentLog log;
  testing::TemporaryDirectory home;
  std::string directory = home / "state/BlackBox";
  BlackBoxSettings settings;
  std::unique_ptr<FileSessionRecords> records = makeRecords();
  std::uint64_t unreadable = 0;
};

TEST_F(FileSessionRecordsTest, WithoutASessionNothingIsMadeAndNothingWakesTheLoop) {
  loop.drain();
  EXPECT_THAT(recovered(), IsEmpty());
  EXPECT_FALSE(std::filesystem::exists(home / "state"));
  EXPECT_EQ(loop.pendingTimers(), 0U);
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(FileSessionRecordsTest, WhatWasAppendedIsWrittenBeforeTheLoopSleeps) {
  const auto record = records->begin();
  record->append("one");
  EXPECT_THAT(files(), IsEmpty());
  loop.drain();
  ASSERT_THAT(files(), SizeIs(1));
  EXPECT_THAT(testing::readFile(files()[0]), HasSubstr("one"));
}

TEST_F(FileSessionRecordsTest, AFlushWritesAtOnce) {
  const auto record = records->begin();
  record->append("one");
  records->flush();
  EXPECT_THAT(testing::readFile(files().at(0)), HasSubstr("one"));
}

TEST_F(FileSessionRecordsTest, ALongTurnIsWrittenMeanwhile) {
  const auto record = records->begin();
  record->append(std::string(70'000, 'x'));
  EXPECT_THAT(files(), SizeIs(1));
}

TEST_F(FileSessionRecordsTest, FileAndDirectoryAreForTheirUserAlone) {
  leave({"one"});
  struct stat status {};
  ASSERT_EQ(::stat(directory.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0700U);
  ASSERT_EQ(::stat(files().at(0).c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

TEST_F(FileSessionRecordsTest, RoomIsReservedAheadAndTheSizeIsThatOfTheRecord) {
  const auto record = records->begin();
  record->append("one");
  records->flush();
  struct stat status {};
  ASSERT_EQ(::stat(files().at(0).c_str(), &status), 0);
  EXPECT_EQ(status.st_size, 19);
  EXPECT_GE(status.st_blocks * 512, 512 << 10);
}

TEST_F(FileSessionRecordsTest, ARecordThatWasLeftIsFoundOnceAndGoes) {
  leave({"one", "two"});
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"one", "two"}));
  EXPECT_THAT(files(), IsEmpty());
  EXPECT_THAT(recovered(), IsEmpty());
}

TEST_F(FileSessionRecordsTest, ARemovedRecordLeavesNothing) {
  const auto record = records->begin();
  record->append("one");
  loop.drain();
  record->removal("")();
  record->append("two");
  loop.drain();
  EXPECT_THAT(files(), IsEmpty());
}

TEST_F(FileSessionRecordsTest, ARecordOfALivingSessionIsNobodyElses) {
  const auto record = records->begin();
  record->append("one");
  loop.drain();
  EXPECT_THAT(recovered(), IsEmpty());
  EXPECT_THAT(endings(), ElementsAre(".session"));
}

TEST_F(FileSessionRecordsTest, ATornEndIsCutAndCounted) {
  leave({"one", "two"});
  const std::string file = files().at(0);
  std::filesystem::resize_file(file, std::filesystem::file_size(file) - 1);
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"one"}));
  EXPECT_EQ(unreadable, 18U);
}

TEST_F(FileSessionRecordsTest, ALargeRecordIsReadAPartAtATimeAndAsOftenAsAskedFor) {
  constexpr std::size_t kPieces = 24'000;
  leave(Pieces(kPieces, std::string(1000, 'x')));
  {
    std::fstream file(files().at(0), std::ios::in | std::ios::out);
    file.seekp(10 << 20).put('y');
  }
  const auto resident = [] { return testing::ProcessSize::of(::getpid()).residentKilobytes; };
  const std::uint64_t before = resident();
  std::uint64_t most = before;
  makeRecords()->recover([&](const UnfinishedRecord& record) {
    for (int time = 0; time < 2; ++time) {
      std::size_t pieces = 0;
      EXPECT_EQ(record.read([&](std::string_view piece) {
        EXPECT_EQ(piece.size(), 1000U);
        if (++pieces % 1000 == 0) most = std::max(most, resident());
      }),
                1016U);
      EXPECT_EQ(pieces, kPieces - 1);
    }
    return true;
  });
  EXPECT_LT(most - before, 8U << 10U);
}

TEST_F(FileSessionRecordsTest, APieceThatIsLongerThanThatIsReadWhole) {
  const Pieces pieces{"one", std::string(5 << 20, 'x'), "two"};
  leave(pieces);
  EXPECT_TRUE(recovered() == std::vector<Pieces>{pieces});
}

TEST_F(FileSessionRecordsTest, WhatDidNotServeStaysForTheNextTimeHoweverOften) {
  leave({"one"});
  for (int start = 0; start < 4; ++start) EXPECT_THAT(recovered(false), ElementsAre(Pieces{"one"}));
  EXPECT_THAT(endings(), ElementsAre(".session"));
}

TEST_F(FileSessionRecordsTest, ARecordUnderWhichTheAgentEndsIsTriedTwiceAndThenSetAside) {
  leave({"poison"});
  for (const char* ending : {".session.tried", ".session.tried-twice"}) {
    makeRecords()->recover([](const UnfinishedRecord&) -> bool { throw std::runtime_error("broken"); });
    EXPECT_THAT(endings(), ElementsAre(ending));
  }
  EXPECT_THAT(log.lines, SizeIs(2));
  log.lines.clear();
  EXPECT_THAT(recovered(), IsEmpty());
  EXPECT_THAT(endings(), ElementsAre(".session.damaged"));
  EXPECT_THAT(log.lines, ElementsAre(HasSubstr("set aside as " + files()[0])));
  log.lines.clear();
  EXPECT_THAT(recovered(), IsEmpty());
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(FileSessionRecordsTest, OtherThingsInTheDirectoryAreLeftAlone) {
  leave({"one"});
  testing::writeFile(directory + "/note.session", "mine");
  testing::writeFile(home / "elsewhere", "not mine");
  std::filesystem::create_symlink(home / "elsewhere", directory + "/" + std::string(32, 'a') + ".session");
  ASSERT_EQ(::mkfifo((directory + "/" + std::string(32, 'b') + ".session").c_str(), 0600), 0);
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"one"}));
  EXPECT_THAT(files(), SizeIs(3));
  EXPECT_EQ(testing::readFile(home / "elsewhere"), "not mine");
  EXPECT_THAT(log.lines, SizeIs(2));
}

TEST_F(FileSessionRecordsTest, WhereNoDirectoryCanBeHadSessionsGoOnWithOneLineInTheLog) {
  testing::writeFile(home / "state", "in the way");
  const auto record = records->begin();
  for (int turn = 0; turn < 3; ++turn) {
    record->append("one");
    loop.drain();
  }
  EXPECT_THAT(log.lines, ElementsAre(HasSubstr("The black box takes no entries")));
  std::filesystem::remove(home / "state");
  loop.drain();
  record->append("late");
  loop.drain();
  EXPECT_THAT(testing::readFile(files().at(0)), HasSubstr("late"));
}

TEST_F(FileSessionRecordsTest, ADiskThatIsFullForAWhileCostsNoPiece) {
  auto record = records->begin();
  record->append("before");
  loop.drain();
  {
    const testing::FileSizeLimit limit(30);
    record->append("during");
    loop.drain();
    record->append("still");
    loop.drain();
    EXPECT_EQ(std::filesystem::file_size(files().at(0)), 30U);
  }
  record->append("after");
  loop.drain();
  EXPECT_THAT(log.lines, ElementsAre(HasSubstr("File too large"), HasSubstr("again")));
  record.reset();
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"before", "during", "still", "after"}));
}

TEST_F(FileSessionRecordsTest, ADiskThatStaysFullCostsABoundedAmountOfMemoryAndLaterPiecesAreFound) {
  auto record = records->begin();
  record->append("before");
  loop.drain();
  {
    const testing::FileSizeLimit limit(40);
    for (int turn = 0; turn < 40; ++turn) {
      record->append(std::string(100'000, 'x'));
      loop.drain();
    }
  }
  record->append("after");
  record.reset();
  const auto found = recovered();
  ASSERT_THAT(found, SizeIs(1));
  EXPECT_EQ(found[0].front(), "before");
  EXPECT_EQ(found[0].back(), "after");
  EXPECT_LT(found[0].size(), 14U);
}

TEST_F(FileSessionRecordsTest, SyncingKeepsAndRemovesTheSame) {
  settings.sync = true;
  records = makeRecords();
  auto record = records->begin();
  record->append("one");
  records->flush();
  record->append("two");
  records->flush();
  testing::writeFile(home / "reports/Log.log", "lines");
  record->removal(home / "reports")();
  EXPECT_THAT(files(), IsEmpty());
  leave({"three"});
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"three"}));
}

TEST_F(FileSessionRecordsTest, AMediumThatRefusesIsToldOnceAndTriedAgain) {
  settings.sync = true;
  records = makeRecords();
  auto record = records->begin();
  std::size_t whileItRefused = 0;
  const bool canFail = testing::withFailingCalls({{SYS_fdatasync, EINTR, 1}, {SYS_fdatasync, EIO, 2}}, [&] {
    for (const char* piece : {"one", "two"}) {
      record->append(piece);
      records->flush();
    }
    whileItRefused = log.lines.size();
    records->flush();  // nothing new, but what there is has still to go
  });
  if (!canFail) GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_EQ(whileItRefused, 1U);
  EXPECT_THAT(
      log.lines,
      ElementsAre(AllOf(StartsWith("warning: What a session accepted may not outlive the end of the power"),
                        HasSubstr("Input/output error"))));
  EXPECT_TRUE(testing::withFailingCalls({{SYS_fdatasync, EIO, 1}}, [&] { records->flush(); }));
  EXPECT_EQ(log.lines.size(), 1U);  // it went with the third call
}

TEST_F(FileSessionRecordsTest, SyncingTakesTheNamesOnTheWayAlongOnce) {
  settings.sync = true;
  records = makeRecords();
  auto record = records->begin();
  std::vector<std::string> synced;
  const auto noteDirectory = [&synced](const std::uint64_t* words) {
    synced.push_back(std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(words[0])));
    return false;
  };
  const bool canAsk = testing::withFailingCalls({{SYS_fsync, 0, 1, noteDirectory}}, [&] {
    for (const char* piece : {"one", "two"}) {
      record->append(piece);
      records->flush();
    }
    testing::writeFile(home / "reports/Session/Log.log", "lines");
    record->removal(home / "reports/Session")();
  });
  if (!canAsk) GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_THAT(synced, ElementsAre(directory, home / "state", home / "reports/Session", home / "reports"));
}

TEST_F(FileSessionRecordsTest, LogsThatTheMediumRefusesAreToldAndTheRecordGoes) {
  settings.sync = true;
  records = makeRecords();
  auto record = records->begin();
  record->append("one");
  records->flush();
  testing::writeFile(home / "reports/Log.log", "lines");
  const bool canFail =
      testing::withFailingCalls({{SYS_fdatasync, EIO, 1}}, [&] { record->removal(home / "reports")(); });
  if (!canFail) GTEST_SKIP() << "the host lets no system call fail";
  EXPECT_THAT(log.lines, ElementsAre(HasSubstr(home / "reports: Input/output error")));
  EXPECT_THAT(files(), IsEmpty());
}

TEST_F(FileSessionRecordsTest, SwitchedOffItKeepsNothingAndStillFindsWhatWasLeft) {
  leave({"one"});
  settings.enabled = false;
  EXPECT_EQ(makeRecords()->begin(), nullptr);
  EXPECT_THAT(recovered(), ElementsAre(Pieces{"one"}));
}

}  // namespace
}  // namespace zal
