#include "platform/linux/progress/runtime_dump_progress.h"

#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>
#include <thread>

#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/progress/progress_file.h"
#include "tests/support/fake_services.h"
#include "tests/support/file_size_limit.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using State = DumpProgressRecord::State;

class RuntimeDumpProgressTest : public ::testing::Test {
 protected:
  std::shared_ptr<DumpProgress> begin(const std::string& service = "Vistel") {
    return records.begin({service, "/reports/dump", {"Network state", "Archive"}});
  }
  std::string onlyText() const {
    const auto names = dumpProgressNames(directory);
    return names.size() == 1 ? testing::readFile(directory + "/" + names[0]) : "not one record";
  }
  std::vector<DumpProgressRecord> listed() const {
    std::vector<DumpProgressRecord> found;
    for (auto& entry : listDumpProgress(directory)) found.push_back(std::move(entry.record));
    return found;
  }

  testing::TemporaryDirectory root;
  const std::string directory = progressDirectory(root / "run");
  testing::RecordingAgentLog log;
  testing::ManualRunLoop host;
  RuntimeDumpProgress records{host, log, directory};
};

TEST_F(RuntimeDumpProgressTest, NothingIsMadeBeforeTheFirstCollection) {
  EXPECT_EQ(testing::listTree(root.path()), "");
  EXPECT_THAT(listed(), IsEmpty());
}

TEST_F(RuntimeDumpProgressTest, EachLineIsThereAsSoonAsItIsWritten) {
  const ProcessIdentity agent = ProcessIdentity::ofThisProcess();
  std::string expected =
      "BEGIN 1714651387251 pid=" + std::to_string(agent.processId) +
      " start=" + std::to_string(agent.startTime) +
      " steps=2 service=Vistel directory=/reports/dump\nPLAN 1 Network state\nPLAN 2 Archive\n";
  const auto progress = begin();
  EXPECT_EQ(onlyText(), expected);
  host.advance(5ms);
  progress->step(1);
  EXPECT_EQ(onlyText(), expected += "STEP 1 1714651387256\n");
  progress->missing("crash reports", "no such directory");
  EXPECT_EQ(onlyText(), expected += "MISSING crash reports\tno such directory\n");
  progress->done("/reports/dump.zip");
  EXPECT_EQ(onlyText(), expected += "OK 1714651387256 /reports/dump.zip\n");
  progress->failed("late");
  progress->step(2);
  progress->missing("late", "late");
  EXPECT_EQ(onlyText(), expected);
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(RuntimeDumpProgressTest, TheDirectoryAndTheRecordsAreForTheirOwnerAlone) {
  const auto progress = begin();
  struct stat status {};
  ASSERT_EQ(::stat(directory.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0700U);
  ASSERT_EQ(::stat((directory + "/" + dumpProgressNames(directory).at(0)).c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777U, 0600U);
}

TEST_F(RuntimeDumpProgressTest, ARecordThatGoesWithoutAWordReadsAsCutOff) {
  auto progress = begin();
  progress->step(1);
  EXPECT_EQ(listed().at(0).state, State::running);
  progress.reset();
  EXPECT_EQ(listed().at(0).state, State::cutOff);
  EXPECT_EQ(listed().at(0).currentStep, 1U);
}

TEST_F(RuntimeDumpProgressTest, ARecordOutlivesItsService) {
  auto shortLived = std::make_unique<RuntimeDumpProgress>(host, log, directory);
  const auto progress = shortLived->begin({"Nexa", "/d", {"one"}});
  shortLived.reset();
  progress->done("/d.zip");
  EXPECT_EQ(listed().at(0).archivePath, "/d.zip");
}

TEST_F(RuntimeDumpProgressTest, TheRecordOfAKilledAgentStaysAndReadsAsCutOff) {
  const pid_t agent = ::fork();
  if (agent == 0) {
    const auto progress = begin();
    progress->step(2);
    ::raise(SIGKILL);
  }
  ASSERT_GT(agent, 0);
  siginfo_t info{};
  // Dead, but not yet buried: its id still has an owner.
  ASSERT_EQ(::waitid(P_PID, static_cast<id_t>(agent), &info, WEXITED | WNOWAIT), 0);
  ASSERT_THAT(listed(), SizeIs(1));
  EXPECT_EQ(listed()[0].state, State::cutOff);
  ::waitpid(agent, nullptr, 0);
  EXPECT_EQ(listed()[0].state, State::cutOff);
  EXPECT_EQ(listed()[0].currentStep, 2U);
}

TEST_F(RuntimeDumpProgressTest, AnIdThatWasGivenOutAgainIsNotTheAgent) {
  testing::writeFile(
      directory + "/1714651387251-000001-1.progress",
      "BEGIN 1714651387251 pid=" + std::to_string(::getpid()) + " start=1 steps=0 service=x\n");
  EXPECT_EQ(listed().at(0).state, State::cutOff);
}

TEST_F(RuntimeDumpProgressTest, RecordsAreListedInTheOrderOfTheirBeginsAndStrangersAreLeftOut) {
  std::vector<std::shared_ptr<DumpProgress>> open;
  for (const char* const service : {"one", "two", "three"}) open.push_back(begin(service));
  host.advance(1ms);
  open.push_back(begin("four"));
  testing::writeFile(directory + "/0.progress", "garbage");
  testing::writeFile(directory + "/notes", "garbage");
  std::vector<std::string> services;
  for (const auto& record : listed()) services.push_back(record.service);
  EXPECT_THAT(services, ElementsAre("one", "two", "three", "four"));
}

TEST_F(RuntimeDumpProgressTest, TheNewestTwentyAreKeptAndThoseThatRun) {
  const auto running = begin("running");
  for (int i = 0; i < 30; ++i) begin(std::to_string(i))->failed("no");
  const auto last = begin("last");
  const auto found = listed();
  ASSERT_EQ(found.size(), 21U);
  EXPECT_EQ(found[0].service, "running");
  EXPECT_EQ(found[1].service, "11");
  EXPECT_EQ(found[20].service, "last");
  running->done("/there");
  EXPECT_EQ(listed()[0].archivePath, "/there");
}

TEST_F(RuntimeDumpProgressTest, AnEndlessListOfWhatIsMissingLeavesTheRecordReadable) {
  const auto progress = begin();
  for (int i = 0; i < 20'000; ++i) progress->missing(std::string(100, 'x'), std::to_string(i));
  progress->done("/a.zip");
  const auto found = listed();
  ASSERT_THAT(found, SizeIs(1));
  EXPECT_EQ(found[0].state, State::done);
  EXPECT_EQ(found[0].missing.back().what, "more");
  EXPECT_EQ(found[0].missing[1].why, "1");
}

TEST_F(RuntimeDumpProgressTest, WhereNothingCanBeWrittenOneWarningIsSaidAndNothingFails) {
  testing::writeFile(root / "run", "in the way");
  const auto progress = begin();
  progress->step(1);
  progress->missing("a", "b");
  progress->done("/a.zip");
  ASSERT_THAT(log.lines, SizeIs(1));
  EXPECT_THAT(log.lines[0], ::testing::StartsWith("warning: " + directory + "/1714651387251-000001-"));
  EXPECT_THAT(log.lines[0], ::testing::EndsWith(".progress: cannot be written: Not a directory"));
}

TEST_F(RuntimeDumpProgressTest, ALineThatAFullDiskCutsShortIsTakenBack) {
  const auto progress = begin();
  const std::string before = onlyText();
  {
    const testing::FileSizeLimit full(before.size() + 8);
    progress->step(1);
    progress->missing("what", "why");
  }
  EXPECT_EQ(onlyText(), before);
  progress->done("/a.zip");
  EXPECT_EQ(onlyText(), before + "OK 1714651387251 /a.zip\n");
  ASSERT_THAT(log.lines, SizeIs(1));
  EXPECT_THAT(log.lines[0], ::testing::EndsWith(".progress: cannot be written: File too large"));
}

TEST_F(RuntimeDumpProgressTest, ManyThreadsWriteWholeLines) {
  const auto progress = begin();
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&] {
      for (int i = 0; i < 100; ++i) {
        progress->step(1);
        progress->missing("what", "why");
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  progress->done("/a.zip");
  const auto found = listed();
  ASSERT_THAT(found, SizeIs(1));
  EXPECT_EQ(found[0].missing.size(), 400U);
  EXPECT_EQ(found[0].state, State::done);
}

TEST_F(RuntimeDumpProgressTest, ManyCollectionsMayBeginAtOnce) {
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&] { begin()->done("/a.zip"); });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_THAT(listed(), SizeIs(4));
}

}  // namespace
}  // namespace zal
