#include "platform/linux/baseband/baseband_dump_starter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <chrono>
#include <csignal>
#include <filesystem>
#include <thread>

#include "tests/support/child_program.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

/// A writer of the test's own that notes its words and waits until it may go on.
class BasebandDumpStarterTest : public ::testing::Test {
 protected:
  BasebandDumpStarterTest() { writer("echo done > \"$0.done\""); }

  /// Its last lines; before them it notes its words and waits for the file "go".
  void writer(const std::string& rest) const {
    writeFile(program,
              "#!/bin/sh\nfor word in \"$@\"; do echo \"$word\" >> \"$0.words\"; done\necho $$ > \"$0.pid\"\n"
              "while [ ! -e \"$0.go\" ]; do /bin/sleep 0.01; done\n" +
                  rest + "\n");
    std::filesystem::permissions(program, std::filesystem::perms::all);
  }
  void letGoOn() const { writeFile(program + ".go", ""); }
  [[nodiscard]] bool hasBegun() const {
    return eventually([&] { return readFile(program + ".pid").ends_with('\n'); });
  }
  [[nodiscard]] bool markerIsThere() const { return std::filesystem::exists(marker); }
  bool runUntilMarkerIsGone() {
    return eventually([&] {
      loop.poll();
      return !markerIsThere();
    });
  }

  TemporaryDirectory directory;
  const std::string program = directory / "writer";
  const std::string marker = directory / "marker";
  RecordingAgentLog log;
  asio::io_context loop;
  asio::executor_work_guard<asio::io_context::executor_type> keepRunning{loop.get_executor()};
  BasebandDumpStarter starter{loop, log, {program, directory / "reports", marker}};
};

TEST_F(BasebandDumpStarterTest, MarkerIsThereBeforeItReturnsAndTheProgramGetsItsWords) {
  starter.start("a reason \"with\" words");
  EXPECT_TRUE(markerIsThere());
  ASSERT_TRUE(hasBegun());
  EXPECT_EQ(readFile(program + ".words"), "--directory\n" + directory / "reports" + "\n--marker\n" + marker +
                                              "\n--reason\na reason \"with\" words\n");
  letGoOn();
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(BasebandDumpStarterTest, NothingIsStartedForADirectoryThatIsALinkBelowItsRoot) {
  std::filesystem::create_directories(directory / "elsewhere");
  std::filesystem::create_directories(directory / "root");
  std::filesystem::create_directory_symlink("../elsewhere", directory / "root/Baseband");
  BasebandDumpStarter rooted{
      loop, log, {program, directory / "root/Baseband", marker, {{directory / "root"}, ""}}};
  rooted.start("reason");
  EXPECT_FALSE(markerIsThere());
  EXPECT_FALSE(std::filesystem::exists(program + ".words"));
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Baseband dump: cannot make " + directory.path() +
                                                "/root/Baseband: Too many levels of symbolic links"});
}

TEST_F(BasebandDumpStarterTest, SecondStartJoinsTheOneThatRuns) {
  starter.start("first");
  ASSERT_TRUE(hasBegun());
  starter.start("second");
  EXPECT_EQ(log.lines, std::vector<std::string>{
                           "notice: A baseband dump is being written already; it stands for this one too"});
  letGoOn();
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_THAT(readFile(program + ".words"), ::testing::HasSubstr("first"));
  EXPECT_THAT(readFile(program + ".words"), ::testing::Not(::testing::HasSubstr("second")));
}

TEST_F(BasebandDumpStarterTest, AfterItsEndTheNextStartIsANewOneAlthoughTheLoopNeverLooked) {
  letGoOn();
  starter.start("first");
  ASSERT_TRUE(eventually([&] { return std::filesystem::exists(program + ".done"); }));
  EXPECT_TRUE(eventually([&] {
    starter.start("second");
    return readFile(program + ".words").find("second") != std::string::npos;
  }));
  EXPECT_TRUE(runUntilMarkerIsGone());
}

TEST_F(BasebandDumpStarterTest, WithoutTheProgramTheMarkerIsGoneAtOnceAndOneLineSaysWhy) {
  std::filesystem::remove(program);
  starter.start("reason");
  EXPECT_FALSE(markerIsThere());
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Baseband dump: cannot start " + program +
                                                ": No such file or directory"});
}

TEST_F(BasebandDumpStarterTest, MarkerOfAProgramThatWasKilledGoesWithItsEnd) {
  starter.start("reason");
  ASSERT_TRUE(hasBegun());
  ::kill(std::stoi(readFile(program + ".pid")), SIGKILL);
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Baseband dump: the program was ended by signal 9"});
}

TEST_F(BasebandDumpStarterTest, StatusOtherThanZeroIsLogged) {
  writer("exit 3");
  letGoOn();
  starter.start("reason");
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Baseband dump: the program ended with status 3"});
}

TEST_F(BasebandDumpStarterTest, LongReasonIsCutAtACharacter) {
  letGoOn();
  starter.start(std::string(4095, 'x') + "\xC3\xA4 more");
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_THAT(readFile(program + ".words"), ::testing::EndsWith("\n" + std::string(4095, 'x') + "\n"));
}

TEST_F(BasebandDumpStarterTest, MarkerThatCannotBeMadeKeepsNobodyFromWriting) {
  BasebandDumpStarter other(loop, log, {program, directory / "reports", directory / "none/marker"});
  letGoOn();
  other.start("reason");
  EXPECT_TRUE(eventually([&] {
    loop.poll();
    return std::filesystem::exists(program + ".done");
  }));
  EXPECT_EQ(log.lines, std::vector<std::string>{"warning: Cannot make " + directory / "none/marker" +
                                                ": No such file or directory"});
}

TEST_F(BasebandDumpStarterTest, ManyThreadsStartOne) {
  std::vector<std::thread> threads;
  for (int i = 0; i < 8; ++i) threads.emplace_back([&] { starter.start("reason"); });
  for (auto& thread : threads) thread.join();
  ASSERT_TRUE(hasBegun());
  letGoOn();
  EXPECT_TRUE(runUntilMarkerIsGone());
  EXPECT_EQ(log.lines.size(), 7U);
}

}  // namespace
}  // namespace zal::testing
