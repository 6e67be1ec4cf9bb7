#include "dump/dump_directory.h"

#include <gtest/gtest.h>

#include <filesystem>

#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

using namespace std::string_literals;

/// Names below a root that exists: "(root)" stands for it in the results.
class DumpDirectoryTest : public ::testing::Test {
 protected:
  DumpDirectoryTest() { std::filesystem::create_directories(root); }

  [[nodiscard]] std::string directoryOf(const std::string& type,
                                        const std::optional<std::string>& description) const {
    DumpRequest request;
    request.sessionType = type;
    request.dumpTimeText = "TIME";
    const auto path = dumpDirectoryPath(root, home, request, description);
    if (!path) return "(none)";
    EXPECT_EQ(path->substr(0, root.size()), root);
    return "(root)" + path->substr(root.size());
  }

  testing::TemporaryDirectory directory;
  const std::string home = std::filesystem::canonical(directory.path()).string();
  const std::string root = home + "/Reports";
};

TEST_F(DumpDirectoryTest, NamesTypeTimeAndDescription) {
  EXPECT_EQ(directoryOf("Vistel", "no sound"), "(root)/Vistel/Vistel-Log (TIME) (no sound)");
  EXPECT_EQ(directoryOf("Vistel", std::nullopt), "(root)/Vistel/Vistel-Log (TIME)");
}

TEST_F(DumpDirectoryTest, ADescriptionOf25CharactersNamesItWithItsFirst20) {
  EXPECT_EQ(directoryOf("V", "1234567890123456789012345"), "(root)/V/V-Log (TIME) (12345678901234567890)");
  EXPECT_EQ(directoryOf("V", "12345678901234567890"), "(root)/V/V-Log (TIME) (12345678901234567890)");
  EXPECT_EQ(directoryOf("V", "1234567890123456789"), "(root)/V/V-Log (TIME) (1234567890123456789)");
}

TEST_F(DumpDirectoryTest, TheCutIsTakenFromTheUntrimmedText) {
  EXPECT_EQ(directoryOf("V", "     1234567890123456789"), "(root)/V/V-Log (TIME) (     123456789012345)");
  EXPECT_EQ(directoryOf("V", " a "), "(root)/V/V-Log (TIME) ( a )");
}

TEST_F(DumpDirectoryTest, ADescriptionOfOnlySpacesCountsAsNone) {
  EXPECT_EQ(directoryOf("V", "   "), "(root)/V/V-Log (TIME)");
  EXPECT_EQ(directoryOf("V", ""), "(root)/V/V-Log (TIME)");
  EXPECT_EQ(directoryOf("V", "\n\t \u00A0"), "(root)/V/V-Log (TIME)");
}

TEST_F(DumpDirectoryTest, CharactersAreNeverCutInTwo) {
  EXPECT_EQ(directoryOf("V", "123456789012345678é€xyz"), "(root)/V/V-Log (TIME) (123456789012345678é€)");
  EXPECT_EQ(directoryOf("V", "1234567890123456789😀xyz"), "(root)/V/V-Log (TIME) (1234567890123456789)");
  EXPECT_EQ(directoryOf("V", "123456789012345678😀xyz"), "(root)/V/V-Log (TIME) (123456789012345678😀)");
}

TEST_F(DumpDirectoryTest, ARootInTheHomeIsExpanded) {
  DumpRequest request;
  request.sessionType = "V";
  request.dumpTimeText = "TIME";
  EXPECT_EQ(dumpDirectoryPath("~/Reports", home, request, std::nullopt), root + "/V/V-Log (TIME)");
}

TEST_F(DumpDirectoryTest, SlashesInTheTypeMakeDirectories) {
  EXPECT_EQ(directoryOf("a/b", std::nullopt), "(root)/a/b/a/b-Log (TIME)");
  EXPECT_EQ(directoryOf("/etc/passwd", std::nullopt), "(root)/etc/passwd/etc/passwd-Log (TIME)");
  EXPECT_EQ(directoryOf("a/", std::nullopt), "(root)/a/a/-Log (TIME)");
  EXPECT_EQ(directoryOf("~/x", std::nullopt), "(root)/~/x/~/x-Log (TIME)");
}

TEST_F(DumpDirectoryTest, SlashesInTheDescriptionMakeDirectories) {
  EXPECT_EQ(directoryOf("V", "on/off"), "(root)/V/V-Log (TIME) (on/off)");
  EXPECT_EQ(directoryOf("V", "/etc"), "(root)/V/V-Log (TIME) (/etc)");
}

TEST_F(DumpDirectoryTest, DotsThatStayBelowTheRootAreStandardised) {
  EXPECT_EQ(directoryOf(".", std::nullopt), "(root)/.-Log (TIME)");
  EXPECT_EQ(directoryOf("a/../b", std::nullopt), "(root)/b/b-Log (TIME)");
  EXPECT_EQ(directoryOf("V", "x/../y"), "(root)/V/y)");
  EXPECT_EQ(directoryOf("../Reports/V", std::nullopt), "(root)/Reports/V-Log (TIME)");
}

TEST_F(DumpDirectoryTest, NothingLeadsOutOfTheRoot) {
  EXPECT_EQ(directoryOf("..", std::nullopt), "(none)");
  EXPECT_EQ(directoryOf("../..", std::nullopt), "(none)");
  EXPECT_EQ(directoryOf("/../..", std::nullopt), "(none)");
  EXPECT_EQ(directoryOf("V", "x/../../../y"), "(none)");
  EXPECT_EQ(directoryOf("../../Reports-evil", std::nullopt), "(none)");
}

TEST_F(DumpDirectoryTest, ANeighbourWhoseNameBeginsAsTheRootsIsOutside) {
  EXPECT_EQ(directoryOf("V", "/../../../Reportsx"), "(none)");
}

TEST_F(DumpDirectoryTest, NoLinkBelowTheRootIsFollowed) {
  std::filesystem::create_directories(home + "/elsewhere");
  std::filesystem::create_directories(root + "/Other");
  std::filesystem::create_directory_symlink(home + "/elsewhere", root + "/V");
  std::filesystem::create_directory_symlink("Other", root + "/W");
  EXPECT_EQ(directoryOf("V", "x"), "(none)");
  EXPECT_EQ(directoryOf("W", "x"), "(none)");
}

TEST_F(DumpDirectoryTest, ARootThatIsALinkIsTheDirectoryItLeadsTo) {
  std::filesystem::create_directory_symlink(root, home + "/link");
  DumpRequest request;
  request.sessionType = "V";
  request.dumpTimeText = "TIME";
  EXPECT_EQ(dumpDirectoryPath(home + "/link", home, request, std::nullopt), root + "/V/V-Log (TIME)");
}

TEST_F(DumpDirectoryTest, ControlCharactersBecomeUnderscores) {
  EXPECT_EQ(directoryOf("a\nb\0c"s, "x\ry\x7F"), "(root)/a_b_c/a_b_c-Log (TIME) (x_y_)");
  EXPECT_EQ(directoryOf("..\0/.."s, std::nullopt), "(root)/.._/..-Log (TIME)");
}

TEST_F(DumpDirectoryTest, WhatTheShellKnowsIsOnlyText) {
  EXPECT_EQ(directoryOf("$(touch X)", "`touch X`"), "(root)/$(touch X)/$(touch X)-Log (TIME) (`touch X`)");
  EXPECT_EQ(directoryOf("-rf", "\"';"), "(root)/-rf/-rf-Log (TIME) (\"';)");
}

TEST_F(DumpDirectoryTest, ALongTypeIsCutAtACharacterAndKeepsTheTime) {
  const std::string name = directoryOf(std::string(4096, 'a'), "why");
  EXPECT_EQ(name, "(root)/" + std::string(255, 'a') + "/" + std::string(213, 'a') + "-Log (TIME) (why)");
  std::string wide;
  while (wide.size() < 4096) wide += "€";
  const auto path = std::filesystem::path(directoryOf(wide, std::nullopt));
  EXPECT_EQ(path.parent_path().filename().string().size(), 255U);
  // 219 bytes of room are 73 characters of three.
  EXPECT_EQ(path.filename().string(), wide.substr(0, 219) + "-Log (TIME)");
}

TEST_F(DumpDirectoryTest, APathOfTheLongestNamesCanBeMade) {
  std::string wide;
  while (wide.size() < 4096) wide += "€";
  DumpRequest request;
  request.sessionType = wide;
  request.dumpTimeText = "2024-05-02 at 14-03-07 (CEST)";
  const auto path = dumpDirectoryPath(root, home, request, wide);
  ASSERT_TRUE(path);
  std::error_code error;
  std::filesystem::create_directories(*path + " (not archived)", error);
  EXPECT_FALSE(error) << error.message();
}

TEST_F(DumpDirectoryTest, APathThatNoFileSystemTakesIsNone) {
  std::string deep;
  for (int level = 0; level < 2000; ++level) deep += "a/";
  EXPECT_EQ(directoryOf(deep, std::nullopt), "(none)");
}

}  // namespace
}  // namespace zal
