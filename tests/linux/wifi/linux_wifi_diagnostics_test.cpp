#include "platform/linux/wifi/linux_wifi_diagnostics.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <memory>
#include <mutex>

#include "tests/support/child_program.h"
#include "tests/support/fake_services.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using namespace std::chrono_literals;

/// A program of the test's own in the helper's place.
class LinuxWifiDiagnosticsTest : public ::testing::Test {
 protected:
  /// It notes its words, then does what the lines say.
  void program(const std::string& lines) const {
    writeFile(
        helper,
        "#!/bin/sh\nfor word in \"$@\"; do echo \"$word\" >> \"$0.words\"; done\necho $$ > \"$0.pid\"\n" +
            lines + "\n");
    std::filesystem::permissions(helper, std::filesystem::perms::all);
  }
  void make(std::chrono::milliseconds limit = LinuxWifiDiagnostics::kLimit) {
    diagnostics = std::make_unique<LinuxWifiDiagnostics>(log, helper, limit);
  }
  void take(const std::string& reason = "a reason") {
    diagnostics->takeDump(directory / "WiFi", reason, [this](int result) {
      const std::scoped_lock lock(mutex);
      results.push_back(result);
    });
  }
  [[nodiscard]] std::vector<int> sofar() {
    const std::scoped_lock lock(mutex);
    return results;
  }
  [[nodiscard]] bool completesWith(const std::vector<int>& expected) {
    return eventually([&] { return sofar() == expected; });
  }
  [[nodiscard]] bool hasBegun() const {
    return eventually([&] { return readFile(helper + ".pid").ends_with('\n'); });
  }
  [[nodiscard]] pid_t child() const { return std::stoi(readFile(helper + ".pid")); }
  /// The end of the service: nothing completes after it.
  void end() { diagnostics.reset(); }

  TemporaryDirectory directory;
  const std::string helper = directory / "helper";
  RecordingAgentLog log;
  std::mutex mutex;
  std::vector<int> results;
  std::unique_ptr<LinuxWifiDiagnostics> diagnostics;
};

TEST_F(LinuxWifiDiagnosticsTest, ProgramGetsDirectoryAndReasonAndItsStatusIsTheResultOnce) {
  program("exit 0");
  make();
  take("a \"reason\" $HOME");
  EXPECT_TRUE(completesWith({0}));
  EXPECT_EQ(readFile(helper + ".words"),
            "--directory\n" + directory / "WiFi" + "\n--reason\na \"reason\" $HOME\n");
  end();
  EXPECT_EQ(results, std::vector<int>{0});
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(LinuxWifiDiagnosticsTest, OtherStatusIsTheResultToo) {
  program("exit 3");
  make();
  take();
  EXPECT_TRUE(completesWith({3}));
}

TEST_F(LinuxWifiDiagnosticsTest, ReturnsBeforeTheProgramEnds) {
  program("while [ ! -e \"$0.go\" ]; do sleep 0.01; done");
  make();
  take();
  EXPECT_EQ(sofar(), std::vector<int>{});
  writeFile(helper + ".go", "");
  EXPECT_TRUE(completesWith({0}));
}

TEST_F(LinuxWifiDiagnosticsTest, WithoutTheProgramItCompletesInsideTheCallAndSaysWhy) {
  make();
  take();
  EXPECT_EQ(results, std::vector<int>{-1});
  take();
  end();
  EXPECT_EQ(results, (std::vector<int>{-1, -1}));
  const std::string line =
      "warning: Wi-Fi diagnostics: cannot start " + helper + ": No such file or directory";
  EXPECT_EQ(log.lines, (std::vector<std::string>{line, line}));
}

TEST_F(LinuxWifiDiagnosticsTest, ProgramThatHangsIsToldToEndAndCompletesOnce) {
  program("trap 'echo ended > \"$0.ended\"; exit 0' TERM; while :; do sleep 0.01; done");
  make(300ms);
  take();
  EXPECT_TRUE(completesWith({-2}));
  end();
  EXPECT_EQ(results, std::vector<int>{-2});
  EXPECT_EQ(readFile(helper + ".ended"), "ended\n");
}

TEST_F(LinuxWifiDiagnosticsTest, ProgramThatDoesNotListenIsKilled) {
  program("trap '' TERM; while :; do sleep 0.01; done");
  make(100ms);
  take();
  EXPECT_TRUE(completesWith({-2}));
  EXPECT_FALSE(std::filesystem::exists("/proc/" + std::to_string(child())));
}

TEST_F(LinuxWifiDiagnosticsTest, ProgramThatIsKilledByOthersIsBroken) {
  program("kill -9 $$");
  make();
  take();
  EXPECT_TRUE(completesWith({-3}));
}

TEST_F(LinuxWifiDiagnosticsTest, DumpThatIsAskedForMeanwhileEndsWithTheOneThatIsTaken) {
  program("while [ ! -e \"$0.go\" ]; do sleep 0.01; done; exit 1");
  make();
  take("first");
  ASSERT_TRUE(hasBegun());
  take("second");
  writeFile(helper + ".go", "");
  EXPECT_TRUE(completesWith({1, 1}));
  EXPECT_THAT(readFile(helper + ".words"), ::testing::Not(::testing::HasSubstr("second")));
}

TEST_F(LinuxWifiDiagnosticsTest, NextOneAfterTheEndIsANewOne) {
  program("exit 0");
  make();
  take("first");
  ASSERT_TRUE(completesWith({0}));
  EXPECT_TRUE(eventually([&] {
    take("second");
    return readFile(helper + ".words").find("second") != std::string::npos;
  }));
}

TEST_F(LinuxWifiDiagnosticsTest, CompletionMayAskForAnother) {
  program("exit 0");
  make();
  std::atomic<int> rounds{0};
  diagnostics->takeDump(directory.path(), "first", [&](int) {
    ++rounds;
    diagnostics->takeDump(directory.path(), "second", [&](int) { ++rounds; });
  });
  EXPECT_TRUE(eventually([&] { return rounds == 2; }));
}

TEST_F(LinuxWifiDiagnosticsTest, EndOfTheServiceEndsTheProgramAndCompletes) {
  program("trap 'exit 7' TERM; echo > \"$0.ready\"; while :; do sleep 0.01; done");
  make();
  take();
  ASSERT_TRUE(eventually([&] { return std::filesystem::exists(helper + ".ready"); }));
  end();
  EXPECT_EQ(results, std::vector<int>{7});
}

TEST_F(LinuxWifiDiagnosticsTest, LongReasonIsCutAtACharacter) {
  program("exit 0");
  make();
  take(std::string(4095, 'x') + "\xC3\xA4 more");
  EXPECT_TRUE(completesWith({0}));
  EXPECT_THAT(readFile(helper + ".words"), ::testing::EndsWith("\n" + std::string(4095, 'x') + "\n"));
}

TEST_F(LinuxWifiDiagnosticsTest, ItsLimitIsBelowTheFifteenSecondsThatACollectionWaits) {
  EXPECT_EQ(LinuxWifiDiagnostics::kLimit, 13500ms);
}

}  // namespace
}  // namespace zal::testing
