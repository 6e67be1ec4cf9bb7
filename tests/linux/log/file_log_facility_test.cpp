#include "platform/linux/log/file_log_facility.h"

#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <system_error>

#include "tests/linux/log/unzipped.h"
#include "tests/support/fake_services.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using testing::listTree;
using testing::readFile;
using testing::writeFile;

constexpr const char* kRotationQueue = "com.vendel.lirra.log-rotation";

class FileLogFacilityTest : public ::testing::Test {
 protected:
  void start() {
    facility =
        std::make_unique<FileLogFacility>(FileLogFacility::Host{loop, loop, queues, log}, root, settings);
  }
  void record(const std::string& type, const std::string& line) {
    facility->record({6, type, type, false, line, 0});
  }
  void event(const std::string& type, const std::string& line) {
    facility->record({6, type, type + "-Event", false, line, 0});
  }
  [[nodiscard]] std::string content(const std::string& name) const { return readFile(root + "/" + name); }
  static std::string line(const std::string& text) { return "2024-05-02 14:03:07.251 <6> " + text + "\n"; }
  /// All that is kept of a log file, oldest first, generations unpacked.
  [[nodiscard]] std::string history(const std::string& set, const std::string& fileName) const {
    std::string text;
    for (int generation = 9; generation >= 1; --generation) {
      const std::string archive =
          root + "/" + set + "/" + fileName + "." + std::to_string(generation) + ".zip";
      if (std::filesystem::exists(archive)) text += testing::unzipped(archive);
    }
    return text + content(set + "/" + fileName);
  }

  testing::TemporaryDirectory directory;
  const std::string root = directory / "Logs";
  testing::ManualRunLoop loop;
  testing::ManualWorkQueues queues{loop};
  testing::RecordingAgentLog log;
  LogSettings settings;
  std::unique_ptr<FileLogFacility> facility;
};

TEST_F(FileLogFacilityTest, ARecordGoesIntoTheFileOfItsType) {
  start();
  record("Vistel", "[a:b] one");
  event("Vistel", "[a:b] two");
  record("Nexa", "[a:b] three");
  facility->flush();
  EXPECT_EQ(listTree(root), "Nexa/\nNexa/Nexa.log\nVistel/\nVistel/Vistel-Event.log\nVistel/Vistel.log\n");
  EXPECT_EQ(content("Vistel/Vistel.log"), line("[a:b] one"));
  EXPECT_EQ(content("Vistel/Vistel-Event.log"), line("[a:b] two"));
  EXPECT_EQ(content("Nexa/Nexa.log"), line("[a:b] three"));
}

TEST_F(FileLogFacilityTest, EverythingOfARecordIsWritten) {
  start();
  facility->record({4, "T", "T", true, "text\nmore", 99});
  facility->flush();
  EXPECT_EQ(content("T/T.log"), "2024-05-02 14:03:07.251 <4> t=99 zalloggingagent[" +
                                    std::to_string(::getpid()) + "] text\n    | more\n");
}

TEST_F(FileLogFacilityTest, RecordsAreInTheFileBeforeTheLoopSleeps) {
  start();
  loop.post([&] { record("Vistel", "one"); });
  EXPECT_EQ(content("Vistel/Vistel.log"), "");
  loop.drain();
  EXPECT_EQ(content("Vistel/Vistel.log"), line("one"));
}

TEST_F(FileLogFacilityTest, AHealthyFacilityLeavesNoTimerBehind) {
  start();
  record("Vistel", "one");
  loop.drain();
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(FileLogFacilityTest, ALargeBufferDoesNotWaitForTheLoop) {
  start();
  const std::string text(1000, 'x');
  for (int i = 0; i < 250; ++i) record("Vistel", text);
  EXPECT_EQ(content("Vistel/Vistel.log"), "");
  for (int i = 0; i < 10; ++i) record("Vistel", text);
  EXPECT_GE(content("Vistel/Vistel.log").size(), 262'144U);
}

TEST_F(FileLogFacilityTest, AFileThatWasTakenAwayIsMissedOnceASecond) {
  start();
  record("Vistel", "one");
  loop.drain();
  std::filesystem::rename(root + "/Vistel/Vistel.log", root + "/taken");
  loop.advance(999ms);
  record("Vistel", "two");
  loop.drain();
  EXPECT_EQ(content("taken"), line("one") + "2024-05-02 14:03:08.250 <6> two\n");
  loop.advance(1ms);
  record("Vistel", "three");
  loop.drain();
  EXPECT_EQ(content("Vistel/Vistel.log"), "2024-05-02 14:03:08.251 <6> three\n");
}

TEST_F(FileLogFacilityTest, NoTypeLeadsOutOfTheRoot) {
  start();
  for (const char* type : {"../../Vistel", "..", "/etc/passwd", "a/../..", "a\nb"}) record(type, type);
  facility->flush();
  EXPECT_EQ(listTree(directory.path()),
            "Logs/\nLogs/Vistel/\nLogs/Vistel/Vistel.log\nLogs/ZalLogging/\nLogs/ZalLogging/ZalLogging.log\n"
            "Logs/a_b/\nLogs/a_b/a_b.log\nLogs/passwd/\nLogs/passwd/passwd.log\n");
  EXPECT_EQ(content("ZalLogging/ZalLogging.log"), line("..") + line("a/../.."));
}

TEST_F(FileLogFacilityTest, TypesThatNameTheSameSetShareItsFile) {
  start();
  record("Vistel", "one");
  record("x/Vistel", "two");
  record("Vistel/", "three");
  record("Vistel", "four");
  facility->flush();
  EXPECT_EQ(content("Vistel/Vistel.log"), line("one") + line("two") + line("three") + line("four"));
}

TEST_F(FileLogFacilityTest, OpenFilesAreBoundedAndNothingBufferedIsLost) {
  settings.maximumOpenFiles = 2;
  start();
  for (int round = 0; round < 3; ++round) {
    for (const char* type : {"A", "B", "C", "D"}) {
      record(type, std::to_string(round));
      event(type, std::to_string(round));
      EXPECT_LE(facility->openFiles(), 2U);
    }
  }
  facility->flush();
  for (const std::string type : {"A", "B", "C", "D"}) {
    EXPECT_EQ(content(type + "/" + type + ".log"), line("0") + line("1") + line("2")) << type;
    EXPECT_EQ(content(type + "/" + type + "-Event.log"), line("0") + line("1") + line("2")) << type;
  }
  EXPECT_THAT(log.lines, IsEmpty());
}

TEST_F(FileLogFacilityTest, TheFileThatWasNotUsedForLongestIsClosed) {
  settings.maximumOpenFiles = 2;
  start();
  record("A", "1");
  record("B", "1");
  record("A", "2");
  record("C", "1");
  // A was used after B: only B was written out to make room.
  EXPECT_EQ(content("A/A.log"), "");
  EXPECT_EQ(content("B/B.log"), line("1"));
}

TEST_F(FileLogFacilityTest, AFullFileIsRotatedBetweenTwoRecords) {
  settings.rotationSize = 100;
  start();
  record("Vistel", std::string(71, 'a'));  // with time, level and line end: 100 bytes
  record("Vistel", "next");
  facility->flush();
  EXPECT_EQ(content("Vistel/Vistel.log.pending-1"), line(std::string(71, 'a')));
  EXPECT_EQ(content("Vistel/Vistel.log"), line("next"));
  EXPECT_TRUE(queues.runNext(kRotationQueue));
  EXPECT_EQ(listTree(root + "/Vistel"), "Vistel.log\nVistel.log.1.zip\n");
}

TEST_F(FileLogFacilityTest, AFileOneByteShortIsNotRotated) {
  settings.rotationSize = 101;
  start();
  record("Vistel", std::string(71, 'a'));
  record("Vistel", "next");
  facility->flush();
  EXPECT_EQ(content("Vistel/Vistel.log"), line(std::string(71, 'a')) + line("next"));
}

TEST_F(FileLogFacilityTest, NoRecordIsLostDoubledOrReorderedByRotations) {
  settings.rotationSize = 1024;
  start();
  std::string expected;
  for (int i = 0; i < 150; ++i) {
    record("Vistel", "record " + std::to_string(i));
    expected += line("record " + std::to_string(i));
    if (i % 7 == 0) facility->flush();
    if (i % 40 == 0) queues.runAll();
  }
  facility->flush();
  loop.advance(500ms);
  queues.runAll();
  EXPECT_EQ(history("Vistel", "Vistel.log"), expected);
  EXPECT_EQ(listTree(root + "/Vistel"),
            "Vistel.log\nVistel.log.1.zip\nVistel.log.2.zip\nVistel.log.3.zip\nVistel.log.4.zip\n"
            "Vistel.log.5.zip\n");
}

TEST_F(FileLogFacilityTest, RotationsThatFollowEachOtherQuicklyAreCompressedALittleLater) {
  settings.rotationSize = 100;
  start();
  const std::string full(71, 'a');
  record("Vistel", full);
  record("Vistel", full);
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 1U);
  record("Vistel", full);
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 1U);
  loop.advance(499ms);
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 1U);
  loop.advance(1ms);
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 2U);
  loop.advance(1500ms);
  record("Vistel", full);
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 3U);
}

/// Queues of a host that has no descriptor left for a timer.
class TimerlessQueues : public testing::ManualWorkQueues {
 public:
  using ManualWorkQueues::ManualWorkQueues;
  std::unique_ptr<WorkQueue> makeSerial(std::string label, QueuePriority priority) override {
    return std::make_unique<Queue>(ManualWorkQueues::makeSerial(std::move(label), priority));
  }

 private:
  class Queue : public WorkQueue {
   public:
    explicit Queue(std::unique_ptr<WorkQueue> queue) : _queue(std::move(queue)) {}
    [[nodiscard]] const std::string& label() const override { return _queue->label(); }
    void async(Job job) override { _queue->async(std::move(job)); }
    void asyncAfter(std::chrono::nanoseconds /*delay*/, Job /*job*/) override {
      throw std::system_error(std::make_error_code(std::errc::too_many_files_open));
    }

   private:
    const std::unique_ptr<WorkQueue> _queue;
  };
};

TEST_F(FileLogFacilityTest, ARotationThatFindsNoTimerWaitsAndCostsNoRecord) {
  settings.rotationSize = 50;
  TimerlessQueues timerless{loop};
  FileLogFacility own({loop, loop, timerless, log}, root, settings);
  const auto tell = [&](const std::string& text) { own.record({6, "A", "A", false, text, 0}); };
  const std::string second(30, '2'), third(30, '3');
  // The first rotation takes no delay, the next ones would.
  for (const std::string& text : {std::string(30, '1'), second, third}) tell(text);
  EXPECT_THAT(log.lines,
              ElementsAre("warning: " + root + "/A/A.log: its rotation waits: Too many open files"));
  own.flush();
  loop.advance(2s);
  tell("fourth");
  own.flush();
  timerless.runAll();
  EXPECT_EQ(history("A", "A.log"),
            line(std::string(30, '1')) + line(second) + line(third) + "2024-05-02 14:03:09.251 <6> fourth\n");
}

TEST_F(FileLogFacilityTest, WhatAnEarlierProcessLeftIsEndedAtTheStart) {
  writeFile(root + "/Vistel/Vistel.log.pending-7", "first\n");
  writeFile(root + "/Vistel/Vistel-Event.log.pending-8", "event\n");
  writeFile(root + "/Vistel/Vistel.log", "second\n");
  settings.rotationSize = 7;
  start();
  record("Vistel", "third");
  facility->flush();
  EXPECT_EQ(content("Vistel/Vistel.log.pending-9"), "second\n");
  queues.runAll();
  EXPECT_EQ(history("Vistel", "Vistel.log"), "first\nsecond\n" + line("third"));
  EXPECT_EQ(history("Vistel", "Vistel-Event.log"), "event\n");
}

TEST_F(FileLogFacilityTest, WithNothingLeftToRepairNoJobIsStarted) {
  writeFile(root + "/Vistel/Vistel.log", "one\n");
  start();
  EXPECT_EQ(queues.readyJobs(kRotationQueue), 0U);
}

TEST_F(FileLogFacilityTest, ARotationThatCannotBeEndedIsSaid) {
  std::filesystem::create_directories(root + "/Vistel/Vistel.log.pending-1");
  start();
  queues.runAll();
  EXPECT_THAT(log.lines, ElementsAre("warning: " + root +
                                     "/Vistel/Vistel.log: its rotation cannot be ended: Is a directory"));
}

TEST_F(FileLogFacilityTest, AnOutageIsSaidOncePerSetAndItsEndToo) {
  writeFile(root, "in the way");
  start();
  record("A", "one");
  loop.drain();
  record("A", "two");
  loop.drain();
  EXPECT_THAT(log.lines, ElementsAre("warning: " + root +
                                     "/A/A.log: cannot be written: Not a directory; up to "
                                     "4 MiB of records are kept until it can"));
  std::filesystem::remove(root);
  loop.drain();
  EXPECT_EQ(content("A/A.log"), line("one") + line("two"));
  EXPECT_EQ(log.lines.back(), "warning: " + root + "/A/A.log: is written again; 0 records were dropped");
}

TEST_F(FileLogFacilityTest, AnOutageEndsWithoutAnyFurtherRecord) {
  writeFile(root, "in the way");
  start();
  record("A", "one");
  loop.drain();
  EXPECT_EQ(loop.pendingTimers(), 1U);
  loop.advance(1000ms);
  EXPECT_EQ(loop.pendingTimers(), 1U);
  std::filesystem::remove(root);
  loop.advance(999ms);
  loop.advance(1ms);
  EXPECT_EQ(content("A/A.log"), line("one"));
  EXPECT_EQ(loop.pendingTimers(), 0U);
}

TEST_F(FileLogFacilityTest, InAnOutageTheNumberOfSetsIsBoundedToo) {
  writeFile(root, "in the way");
  settings.maximumOpenFiles = 2;
  start();
  for (int i = 0; i < 20; ++i) record("set" + std::to_string(i), "one");
  EXPECT_EQ(facility->openFiles(), 8U);
  EXPECT_EQ(log.lines.back(), "warning: too many log sets wait for the disk; records of more are dropped");
  std::filesystem::remove(root);
  loop.drain();
  EXPECT_LE(facility->openFiles(), 2U);
  for (int i = 0; i < 8; ++i) {
    const std::string set = "set" + std::to_string(i);
    EXPECT_EQ(content(set + "/" + set + ".log"), line("one"));
  }
  record("set19", "two");
  EXPECT_EQ(log.lines.back(), "warning: 12 records of further log sets were dropped");
}

/// An agent log whose lines are records again, as the real one's are.
class SpeakingAgentLog : public testing::RecordingAgentLog {
 public:
  PlatformLogFacility* facility = nullptr;
  void warning(std::string_view text) override {
    RecordingAgentLog::warning(text);
    if (facility != nullptr) facility->record({4, "ZalLogging", "ZalLogging", false, text, 0});
  }
};

TEST_F(FileLogFacilityTest, AWarningAboutAFailureIsInItsFileBeforeTheLoopSleeps) {
  SpeakingAgentLog speaking;
  writeFile(root + "/A", "in the way");
  FileLogFacility own({loop, loop, queues, speaking}, root, settings);
  speaking.facility = &own;
  own.record({6, "A", "A", false, "one", 0});
  loop.drain();
  EXPECT_EQ(
      content("ZalLogging/ZalLogging.log"),
      "2024-05-02 14:03:07.251 <4> " + root +
          "/A/A.log: cannot be written: Not a directory; up to 4 MiB of records are kept until it can\n");
}

TEST_F(FileLogFacilityTest, AFacilityThatFailsForItsOwnWarningsDoesNotRunInCircles) {
  SpeakingAgentLog speaking;
  writeFile(root, "in the way");
  FileLogFacility own({loop, loop, queues, speaking}, root, settings);
  speaking.facility = &own;
  own.record({6, "A", "A", false, "one", 0});
  loop.drain();
  loop.drain();
  EXPECT_EQ(speaking.lines.size(), 2U);
  speaking.facility = nullptr;
}

TEST_F(FileLogFacilityTest, WhatIsBufferedIsWrittenAtTheEnd) {
  start();
  record("Vistel", "one");
  facility.reset();
  EXPECT_EQ(content("Vistel/Vistel.log"), line("one"));
  loop.drain();
}

TEST_F(FileLogFacilityTest, AHugeRecordIsWrittenWhole) {
  start();
  const std::string text(5U << 20U, 'x');
  record("Vistel", text);
  record("Vistel", "next");
  facility->flush();
  EXPECT_TRUE(content("Vistel/Vistel.log.pending-1") == line(text));
  EXPECT_EQ(content("Vistel/Vistel.log"), line("next"));
}

}  // namespace
}  // namespace zal
