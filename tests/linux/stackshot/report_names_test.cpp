#include "platform/linux/stackshot/report_names.h"

#include <gtest/gtest.h>

namespace zal::testing {
namespace {

using stackshot::crashReportName;
using stackshot::stackshotName;
using stackshot::variantOf;

constexpr LocalTime kTime{2026, 3, 4, 5, 6, 7, 89};

TEST(ReportNamesTest, ACrashReportIsTheProcessOneSeparatorAndSeventeenCharacters) {
  EXPECT_EQ(crashReportName("zalagent", kTime), "zalagent-2026-03-04-050607.crash");
}

TEST(ReportNamesTest, AProcessCannotLeadTheFileElsewhereOrHideIt) {
  EXPECT_EQ(crashReportName("../../etc/x", kTime), "_._.._etc_x-2026-03-04-050607.crash");
  EXPECT_EQ(crashReportName("kworker/0:1", kTime), "kworker_0:1-2026-03-04-050607.crash");
  EXPECT_EQ(crashReportName(".hidden", kTime), "_hidden-2026-03-04-050607.crash");
  EXPECT_EQ(crashReportName("a b\n", kTime), "a_x20b_x0a-2026-03-04-050607.crash");
  EXPECT_EQ(crashReportName("", kTime), "_-2026-03-04-050607.crash");
}

TEST(ReportNamesTest, AStackshotSortsBeforeACrashReportOfItsPrefix) {
  EXPECT_EQ(stackshotName(kTime), "Homeframe+2026-03-04-050607.stackshot");
  EXPECT_LT(stackshotName(kTime), crashReportName("Homeframe", {2026, 1, 1, 0, 0, 0, 0}));
}

TEST(ReportNamesTest, AVariantKeepsTheStampInItsPlace) {
  EXPECT_EQ(variantOf(stackshotName(kTime), 2), "Homeframe+2026-03-04-050607-2.stackshot");
}

}  // namespace
}  // namespace zal::testing
