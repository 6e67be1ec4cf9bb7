#include "platform/linux/files/root_parents.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "platform/open_directories.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

class RootParentsTest : public ::testing::Test {
 protected:
  RootParentsTest() {
    roots.UserLogRoot = home / "state/lirra/Logs";
    roots.MobileLogRoot = roots.UserLogRoot;
    roots.DiagnosticReportRoot = roots.UserLogRoot + "/DiagnosticReports";
    roots.SystemReportRoot = home / "system/Reports";
    roots.TemporaryRoot = home / "tmp";
  }
  /// The permission bits in octal digits; "none" where there is nothing.
  [[nodiscard]] static std::string modeOf(const std::string& path) {
    struct stat status {};
    if (::stat(path.c_str(), &status) != 0) return "none";
    char text[8];
    std::snprintf(text, sizeof text, "%03o", status.st_mode & 0777U);
    return text;
  }
  TemporaryDirectory home;
  DirectoryRoots roots;
};

TEST_F(RootParentsTest, TheWayToTheRootsIsForTheirOwnerAloneAndWhatIsBelowForAll) {
  makeRootParents(roots);
  EXPECT_EQ(modeOf(home / "state"), "700");
  EXPECT_EQ(modeOf(home / "state/lirra"), "700");
  EXPECT_EQ(modeOf(home / "system"), "700");
  EXPECT_EQ(modeOf(roots.UserLogRoot), "none");
  ASSERT_FALSE(createDirectoriesWithMode0777(roots.DiagnosticReportRoot + "/Vistel"));
  EXPECT_EQ(modeOf(home / "state/lirra"), "700");
  EXPECT_EQ(modeOf(roots.UserLogRoot), "777");
  EXPECT_EQ(modeOf(roots.DiagnosticReportRoot + "/Vistel"), "777");
}

TEST_F(RootParentsTest, WhatExistsKeepsItsMode) {
  std::filesystem::create_directories(home / "state/lirra");
  ASSERT_EQ(::chmod((home / "state/lirra").c_str(), 0755), 0);
  makeRootParents(roots);
  EXPECT_EQ(modeOf(home / "state/lirra"), "755");
}

TEST_F(RootParentsTest, AFileInTheWayHarmsNobody) {
  writeFile(home / "state", "a file");
  makeRootParents(roots);
  EXPECT_EQ(readFile(home / "state"), "a file");
  EXPECT_EQ(modeOf(home / "system"), "700");
}

}  // namespace
}  // namespace zal::testing
