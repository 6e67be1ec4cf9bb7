#include "collectors/missing_output.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

std::string missingIn(std::string_view output) {
  std::string text;
  for (const auto& [program, reason] : missingPrograms(output)) text += program + " (" + reason + ")\n";
  return text;
}

TEST(MissingProgramsTest, KnowsTheWordsOfTheShells) {
  EXPECT_EQ(missingIn("sh: 1: /usr/bin/voltra: not found\n"), "/usr/bin/voltra (not found)\n");
  EXPECT_EQ(missingIn("/bin/sh: 1: foo: not found\n"), "foo (not found)\n");
  EXPECT_EQ(missingIn("dash: 12: foo: not found"), "foo (not found)\n");
  EXPECT_EQ(missingIn("sh: 1: /etc/passwd: Permission denied\n"), "/etc/passwd (Permission denied)\n");
  EXPECT_EQ(missingIn("bash: line 1: foo: command not found\n"), "foo (command not found)\n");
  EXPECT_EQ(missingIn("bash: foo: command not found\n"), "foo (command not found)\n");
  EXPECT_EQ(missingIn("/usr/bin/bash: line 3: /usr/bin/foo: No such file or directory\n"),
            "/usr/bin/foo (No such file or directory)\n");
  EXPECT_EQ(missingIn("bash: line 1: /tmp: Is a directory\n"), "/tmp (Is a directory)\n");
  EXPECT_EQ(missingIn("sh: foo: not found\n"), "foo (not found)\n");
}

TEST(MissingProgramsTest, KnowsTheWordsOfTimeoutInEveryLocaleOfEnglish) {
  EXPECT_EQ(missingIn("timeout: failed to run command 'bluetoothctl': No such file or directory\n"),
            "bluetoothctl (No such file or directory)\n");
  EXPECT_EQ(
      missingIn("timeout: failed to run command \xe2\x80\x98/usr/bin/x\xe2\x80\x99: Permission denied\n"),
      "/usr/bin/x (Permission denied)\n");
}

TEST(MissingProgramsTest, SeveralComplaintsNameEachProgramOnce) {
  EXPECT_EQ(missingIn("sh: 1: one: not found\nsh: 1: two: Permission denied\nsh: 1: one: not found\n"),
            "one (not found)\ntwo (Permission denied)\n");
}

TEST(MissingProgramsTest, AnOutputThatHoldsAnythingElseIsNotMissing) {
  for (const char* output :
       {"", "\n", "Filesystem  Size  Used\n", "sh: 1: one: not found\nModule  Size\n",
        "Module  Size\nsh: 1: one: not found\n", "sh: 1: one: not found\n\n",
        "ls: cannot access 'x': not found", "sh: 1: cannot create /x/y: Permission denied\n",
        "sh: 1: Syntax error: end of file unexpected\n", "sh: 1: : not found\n", "sh: 1: not found\n",
        "sh: not found", ": 1: foo: not found\n", "fish: 1: foo: not found\n", "sh: x1: foo: went away\n",
        "timeout: failed to run command ", "Corvell: no process found\n"}) {
    EXPECT_EQ(missingIn(output), "") << output;
  }
}

TEST(MissingProgramsTest, AProgramsNameMayHoldColonsAndBlanks) {
  EXPECT_EQ(missingIn("sh: 1: odd: name: not found\n"), "odd: name (not found)\n");
  EXPECT_EQ(missingIn("sh: 1: odd name: not found\n"), "odd name (not found)\n");
}

class MissingOutputTest : public ::testing::Test {
 protected:
  std::string found() const {
    std::string text;
    for (const auto& [file, missing] : missingOutputs(directory.path())) {
      text += file + ": " + missing.program + " " + missing.reason + "\n";
    }
    return text;
  }
  TemporaryDirectory directory;
};

TEST_F(MissingOutputTest, NamesTheFilesOfAllDirectoriesInOrder) {
  writeFile(directory / "WiFi/radio.txt", "sh: 1: radiot: not found\n");
  writeFile(directory / "Console/lsof.txt", "COMMAND PID\n");
  writeFile(directory / "Console/power.txt", "sh: 1: upower: not found\nsh: 1: grep: not found\n");
  writeFile(directory / "a.txt", "sh: 1: /usr/bin/a: Permission denied\n");
  writeFile(directory / "empty.txt", "");
  EXPECT_EQ(found(),
            "Console/power.txt: upower not found\nConsole/power.txt: grep not found\n"
            "WiFi/radio.txt: radiot not found\na.txt: /usr/bin/a Permission denied\n");
}

TEST_F(MissingOutputTest, FilesOfMoreThanFourKibibytesAreNotLookedAt) {
  std::string complaints;
  while (complaints.size() < 4096 - 64) complaints += "sh: 1: foo: not found\n";
  const std::string last = "sh: 1: " + std::string(4096 - complaints.size() - 7 - 12, 'x') + ": not found\n";
  ASSERT_EQ((complaints + last).size(), 4096U);
  writeFile(directory / "largest", complaints + last);
  writeFile(directory / "larger", complaints + "x" + last);
  EXPECT_EQ(missingOutputs(directory.path()).size(), 2U);  // of the largest: foo and the other
  EXPECT_EQ(missingOutputs(directory.path())[0].file, "largest");
}

TEST_F(MissingOutputTest, LinksAndPipesAreNotOpened) {
  const TemporaryDirectory elsewhere;
  writeFile(elsewhere / "out/file", "sh: 1: foo: not found\n");
  std::filesystem::create_symlink(elsewhere / "out/file", directory / "link");
  std::filesystem::create_directory_symlink(elsewhere / "out", directory / "linked");
  ASSERT_EQ(::mkfifo((directory / "pipe").c_str(), 0600), 0);
  EXPECT_EQ(found(), "");
}

TEST_F(MissingOutputTest, AMissingDirectoryLacksNothing) {
  EXPECT_EQ(missingOutputs(directory / "missing"), std::vector<MissingOutput>{});
}

}  // namespace
}  // namespace zal::testing
