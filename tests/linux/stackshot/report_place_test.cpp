#include "platform/linux/stackshot/report_place.h"

#include <gtest/gtest.h>

#include "tests/support/temporary_directory.h"

namespace zal::testing {
namespace {

using stackshot::placeReport;

class ReportPlaceTest : public ::testing::Test {
 protected:
  TemporaryDirectory directory;
};

TEST_F(ReportPlaceTest, ADirectoryGetsTheNameAndThenItsVariants) {
  EXPECT_EQ(placeReport(directory.path(), "a.crash", "one").path, directory / "a.crash");
  EXPECT_EQ(placeReport(directory.path() + "/", "a.crash", "two").path, directory / "a-2.crash");
  EXPECT_EQ(placeReport(directory.path(), "a.crash", "three").path, directory / "a-3.crash");
  EXPECT_EQ(listTree(directory.path()), "a-2.crash\na-3.crash\na.crash\n");
  EXPECT_EQ(readFile(directory / "a-2.crash"), "two");
}

TEST_F(ReportPlaceTest, ADirectoryThatIsMissingIsMadeWhenTheSlashSaysThatItIsOne) {
  EXPECT_FALSE(placeReport(directory / "new/reports/", "a.crash", "one").error);
  EXPECT_EQ(listTree(directory.path()), "new/\nnew/reports/\nnew/reports/a.crash\n");
}

TEST_F(ReportPlaceTest, AFileIsReplacedAndForItsOwnerAlone) {
  writeFile(directory / "file", "old");
  EXPECT_EQ(placeReport(directory / "file", "a.crash", "new").path, directory / "file");
  EXPECT_EQ(readFile(directory / "file"), "new");
  EXPECT_EQ(std::filesystem::status(directory / "file").permissions(), std::filesystem::perms(0600));
}

TEST_F(ReportPlaceTest, AFileWhereTheDirectoryBelongsLeavesNothingBehind) {
  writeFile(directory / "file", "");
  EXPECT_TRUE(placeReport(directory / "file/", "a.crash", "one").error);
  EXPECT_TRUE(placeReport(directory / "file/a.crash", "a.crash", "one").error);
  EXPECT_EQ(listTree(directory.path()), "file\n");
}

}  // namespace
}  // namespace zal::testing
