#include "session/reference_time.h"

#include <gtest/gtest.h>

#include "collectors/command_runner.h"
#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

class ReferenceTimeTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory directory;
  testing::ScriptedShell shell;
  testing::PlainFilePlacement files{directory.path()};
  testing::RecordingAgentLog log;
  CommandRunner commands{shell, files, log};
  std::string file = directory / "time-file.txt";

  void answer(std::string text) {
    shell.respond = [this, text](const std::string&) {
      testing::writeFile(file, text);
      return 0;
    };
  }
  std::optional<std::string> reference() { return referenceTime(commands, directory.path()); }
};

TEST_F(ReferenceTimeTest, AsksTheToolAndWaits) {
  answer("2024-05-02T12:03:07Z\n");
  EXPECT_EQ(reference(), "2024-05-02T12:03:07Z");
  EXPECT_EQ(shell.commands,
            std::vector<std::string>{"/usr/local/bin/horvand getReferenceTime > \"" + file + "\"  2>&1"});
}

TEST_F(ReferenceTimeTest, IsUnknownWithoutAFile) { EXPECT_EQ(reference(), "Unknown reference time!"); }

TEST_F(ReferenceTimeTest, IsTheLineWithoutItsNewline) {
  answer("12345.678\n");
  EXPECT_EQ(reference(), "12345.678");
}

TEST_F(ReferenceTimeTest, IsWhatTheShellSaysOfAMissingTool) {
  answer("sh: 1: /usr/local/bin/horvand: not found\n");
  EXPECT_EQ(reference(), "sh: 1: /usr/local/bin/horvand: not found");
}

TEST_F(ReferenceTimeTest, IsNothingWhenTheFileCannotBeReadAsText) {
  answer("\xFF\xFE");
  EXPECT_EQ(reference(), std::nullopt);
}

TEST_F(ReferenceTimeTest, IsNothingWhenADirectoryTookTheName) {
  std::filesystem::create_directory(file);
  EXPECT_EQ(reference(), std::nullopt);
}

TEST_F(ReferenceTimeTest, IsNothingWhenTheTextIsBeyondAllMeasure) {
  answer(std::string(65'537, 'x'));
  EXPECT_EQ(reference(), std::nullopt);
  answer(std::string(65'536, 'x'));
  EXPECT_EQ(reference(), std::string(65'536, 'x'));
}

TEST_F(ReferenceTimeTest, LeavesTheFileInPlace) {
  answer("now\n");
  ASSERT_EQ(reference(), "now");
  EXPECT_EQ(testing::readFile(file), "now\n");
}

}  // namespace
}  // namespace zal
