#include "session/line_file.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "session/quality_log_list.h"
#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

class LineFileTest : public ::testing::Test {
 protected:
  testing::TemporaryDirectory directory;
  testing::RecordingAgentLog log;
  testing::PlainFilePlacement files{directory / "home"};
  std::string path = directory / "Log.log";
  void write(const std::vector<std::string_view>& lines) {
    QualityLogList list;
    for (const auto line : lines) list.append(line);
    writeStrings(list.copy(), files, path, log);
  }
  /// Written last line first, so that no two lines are neighbours in memory as they are in the file.
  void writeReversed(const std::vector<std::string_view>& lines) {
    QualityLogList list;
    for (const auto line : lines) list.insertAtFront(line);
    writeStrings(list.copy(), files, path, log);
  }
  [[nodiscard]] std::string written() const { return testing::readFile(path); }
};

TEST_F(LineFileTest, EndsEveryLineWithANewline) {
  write({"one", "", "two\nlines"});
  EXPECT_EQ(written(), "one\n\ntwo\nlines\n");
}

TEST_F(LineFileTest, MakesAnEmptyFileOfNoLines) {
  write({});
  EXPECT_TRUE(std::filesystem::exists(path));
  EXPECT_EQ(written(), "");
}

TEST_F(LineFileTest, ReplacesWhatWasThere) {
  testing::writeFile(path, "something longer than what comes");
  write({"new"});
  EXPECT_EQ(written(), "new\n");
}

TEST_F(LineFileTest, ALineWithOneTwoByteCharacterLosesItsNewline) {
  write({"café", "next"});
  EXPECT_EQ(written(), "cafénext\n");
}

TEST_F(LineFileTest, ALineLosesAsManyBytesAsItsUtf8FormIsLonger) {
  write({"€", "€uro", "é"});  // 2 of 4 bytes, 5 of 7, 2 of 3
  EXPECT_EQ(written(), "\xE2\x82€uré");
}

TEST_F(LineFileTest, ACharacterOutsideTheBasicPlaneCountsTwoUnits) {
  write({"😀", "x"});  // 3 of 5 bytes
  EXPECT_EQ(written(),
            "\xF0\x9F\x98"
            "x\n");
}

TEST_F(LineFileTest, WritesMoreThanOneBuffer) {
  const std::string large(700'001, 'a');
  write({large, large, large, "end"});
  EXPECT_EQ(written(), large + "\n" + large + "\n" + large + "\nend\n");
}

TEST_F(LineFileTest, WritesManyLinesInAnyOrderOfMemory) {
  std::vector<std::string> lines;
  for (int number = 0; number < 100'000; ++number) lines.push_back("line " + std::to_string(number));
  std::string forward;
  std::string backward;
  for (const auto& line : lines) forward += line + "\n";
  for (auto line = lines.rbegin(); line != lines.rend(); ++line) backward += *line + "\n";
  write({lines.begin(), lines.end()});
  EXPECT_TRUE(written() == forward);
  writeReversed({lines.begin(), lines.end()});
  EXPECT_TRUE(written() == backward);
}

TEST_F(LineFileTest, NeverWritesMoreThanTheLineOfBytesThatAreNoText) {
  write({"\xFF\xFF\xFF", "x"});
  EXPECT_EQ(written(), "\xFF\xFF\xFF\nx\n");
}

TEST_F(LineFileTest, AFullDiskCostsOneWarning) {
  path = "/dev/full";
  const std::string large(700'000, 'a');
  write({large, large, large, large});
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: Could not write /dev/full: No space left on device"});
}

TEST_F(LineFileTest, AFullDiskIsNoticedByASmallFileToo) {
  path = "/dev/full";
  write({"x"});
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: Could not write /dev/full: No space left on device"});
}

TEST_F(LineFileTest, ALinkOrASecondNameLaidAtTheNameIsNeitherFollowedNorOverwritten) {
  const std::string victim = directory / "victim";
  testing::writeFile(victim, "untouched");
  path = directory / "symbolic";
  std::filesystem::create_symlink(victim, path);
  write({"x"});
  EXPECT_EQ(written(), "x\n");
  path = directory / "hard";
  std::filesystem::create_hard_link(victim, path);
  write({"y"});
  EXPECT_EQ(written(), "y\n");
  EXPECT_EQ(testing::readFile(victim), "untouched");
  EXPECT_EQ(log.lines, std::vector<std::string>{});
}

TEST_F(LineFileTest, AFileThatCannotBeOpenedCostsOneWarning) {
  path = directory / "missing/Log.log";
  write({"x"});
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: Could not write " + path + ": No such file or directory"});
}

}  // namespace
}  // namespace zal
