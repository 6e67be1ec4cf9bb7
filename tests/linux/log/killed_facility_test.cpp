#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

#include <gtest/gtest.h>

#include "platform/linux/log/file_log_facility.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"
#include "tests/linux/log/unzipped.h"
#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using testing::readFile;
using testing::unzipped;

constexpr int kRecords = 300;
constexpr std::uint64_t kRotationSize = 2048;  // some seven rotations

/// All that is kept of the set "T", oldest first.
std::string history(const std::string& root) {
  std::string text;
  for (int generation = 9; generation >= 1; --generation) {
    const std::string archive = root + "/T/T.log." + std::to_string(generation) + ".zip";
    if (std::filesystem::exists(archive)) text += unzipped(archive);
  }
  return text + readFile(root + "/T/T.log");
}

/// The numbers of the records "number N" in the text.
std::vector<int> numbersIn(const std::string& text) {
  constexpr std::string_view kWord = "number ";
  std::vector<int> numbers;
  for (std::size_t at = 0; (at = text.find(kWord, at)) != std::string::npos; at += kWord.size()) {
    numbers.push_back(std::atoi(text.c_str() + at + kWord.size()));
  }
  return numbers;
}

/// A facility that a test can kill: rotations run wherever the loop is drained.
class OneProcess {
 public:
  explicit OneProcess(const std::string& root) : _facility({_loop, _loop, _queues, _log}, root, settings()) {}
  static LogSettings settings() {
    LogSettings settings;
    settings.rotationSize = kRotationSize;
    return settings;
  }
  void record(int number) {
    const std::string line = "number " + std::to_string(number) + " ";
    _facility.record({6, "T", "T", false, line, 0});
    _facility.flush();
  }
  void work() {
    _loop.advance(500ms);
    _queues.runAll();
  }

 private:
  testing::ManualRunLoop _loop;
  testing::ManualWorkQueues _queues{_loop};
  testing::RecordingAgentLog _log;
  FileLogFacility _facility;
};

/// Records in a child process that is killed right after it told that so many records are in.
/// Returned: how many it told of before it died.
int recordUntilKilled(const std::string& root, int first, int killAfter) {
  int ends[2];
  if (::pipe(ends) != 0) return -1;
  std::fflush(nullptr);  // or the child would print what is still buffered once more
  const pid_t child = ::fork();
  if (child == 0) {
    OneProcess process(root);
    for (int number = first; number < kRecords; ++number) {
      process.record(number);
      if (::write(ends[1], "x", 1) != 1) ::_exit(1);
      process.work();
    }
    ::_exit(0);
  }
  ::close(ends[1]);
  int told = 0;
  for (char mark = 0; ::read(ends[0], &mark, 1) == 1;) {
    if (++told == killAfter) ::kill(child, SIGKILL);
  }
  ::close(ends[0]);
  ::waitpid(child, nullptr, 0);
  return told;
}

TEST(KilledFacilityTest, WhatWasWrittenBeforeAKillIsThereOnceAndInOrder) {
  // A kill comes while the next record is written or a rotation is on its way, wherever it hits.
  for (int killAfter = 3; killAfter < 140; killAfter += 34) {
    SCOPED_TRACE(killAfter);
    const testing::TemporaryDirectory directory;
    const std::string root = directory / "Logs";
    int next = 0;
    while (next < kRecords) {
      const int told = recordUntilKilled(root, next, killAfter);
      ASSERT_GT(told, 0);
      next += told;
      // A record that was written but not told of is in the file all the same.
      const OneProcess repair(root);
      const std::vector<int> kept = numbersIn(history(root));
      if (!kept.empty() && kept.back() >= next) next = kept.back() + 1;
    }
    OneProcess repair(root);
    repair.work();
    const std::vector<int> numbers = numbersIn(history(root));
    ASSERT_EQ(numbers.size(), static_cast<std::size_t>(kRecords));
    for (int number = 0; number < kRecords; ++number) ASSERT_EQ(numbers[number], number);
    for (const auto& entry : std::filesystem::directory_iterator(root + "/T")) {
      const std::string name = entry.path().filename().string();
      EXPECT_TRUE(name.find("pending") == std::string::npos && name.find("ready") == std::string::npos &&
                  name.find("tmp") == std::string::npos)
          << name;
    }
  }
}

TEST(RealQueuesTest, RecordingGoesOnWhileRotationsRun) {
  const testing::TemporaryDirectory directory;
  const std::string root = directory / "Logs";
  testing::RecordingAgentLog log;
  LinuxClock clock;
  LinuxRunLoop loop;
  LinuxWorkQueues queues(loop, [](std::string_view line) { ADD_FAILURE() << line; });
  FileLogFacility facility({clock, loop, queues, log}, root, OneProcess::settings());
  int number = 0;
  // 200 records of 38 to 40 bytes fill 2048 bytes three times.
  const auto isRotated = [&] {
    const std::string file = root + "/T/T.log.";
    return std::filesystem::exists(file + "3.zip") && std::filesystem::exists(file + "1.zip") &&
           findUnfinishedRotations(root).files.empty();
  };
  loop.callEvery(5ms, [&] {
    for (int i = 0; i < 10 && number < 200; ++i) {
      const std::string line = "number " + std::to_string(number++) + " ";
      facility.record({6, "T", "T", false, line, 0});
    }
    if (number == 200 && isRotated()) loop.stop();
  });
  loop.callAfter(30s, [&] {
    ADD_FAILURE() << "the rotations did not end";
    loop.stop();
  });
  loop.run();
  std::vector<int> expected;
  for (int i = 0; i < 200; ++i) expected.push_back(i);
  EXPECT_EQ(numbersIn(history(root)), expected);
  EXPECT_TRUE(log.lines.empty());
}

}  // namespace
}  // namespace zal
