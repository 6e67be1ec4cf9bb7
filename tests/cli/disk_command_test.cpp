#include <gmock/gmock.h>

#include "tests/cli/tool_fixture.h"

namespace zal::testing {
namespace {

using ::testing::HasSubstr;

class DiskCommandTest : public ToolFixture {
 protected:
  static constexpr std::uint64_t kMebibyte = 1U << 20U;

  DiskCommandTest() {
    machine.keptStore.disk = {1000 * kMebibyte, 400 * kMebibyte};
    machine.toolSettings.roots.DiagnosticReportRoot = "/reports";
  }
  KeptItem& keep(const std::string& path, const std::string& type, std::uint64_t mebibytes, int daysOld) {
    KeptItem item;
    item.path = path;
    item.type = type;
    item.bytes = mebibytes * kMebibyte;
    item.changed = machine.wall - std::chrono::hours(24 * daysOld);
    machine.keptStore.kept.push_back(item);
    return machine.keptStore.kept.back();
  }
  void keepTooMuch() {
    keep("/reports/Vistel/failed.zip", "Vistel", 30, 9);
    keep("/reports/Vistel/old.zip", "Vistel", 30, 8).kind = KeptKind::dump;
    keep("/reports/Vistel/new\n.zip", "Vistel", 30, 1);
    keep("/reports/Nexa/latest.zip", "Nexa", 20, 3).inUse = "the latest of its type";
    machine.keptStore.failedCalls = {"/reports/Vistel/failed.zip"};
  }
};

TEST_F(DiskCommandTest, WhatIsKeptIsShownByKindAndByTypeBesideWhatMayBeKept) {
  keepTooMuch();
  EXPECT_EQ(run({"disk"}), 0);
  EXPECT_EQ(out, R"(kept    110.0 MiB of 100.0 MiB (110 %)
free    400.0 MiB of 1000.0 MiB (40 %); 150.0 MiB shall stay free
in      /reports

KIND       ITEMS       SIZE
session        3   80.0 MiB  9 days ago
dump           1   30.0 MiB  8 days ago

TYPE       ITEMS       SIZE  OLDEST
Vistel         3   90.0 MiB  9 days ago
Nexa           1   20.0 MiB  3 days ago

1 item, 30.0 MiB would go now; --simulate shows which.
)");
}

TEST_F(DiskCommandTest, WhereNothingIsKeptAndNothingLimitedItSaysSo) {
  machine.toolSettings.disk = {.size = 0, .share = 0, .keepFree = 0};
  machine.keptStore.disk = {};
  EXPECT_EQ(run({"disk"}), 0);
  EXPECT_EQ(out, R"(kept    0 B; no limit
free    cannot be told
in      /reports

KIND       ITEMS       SIZE
nothing is kept

Nothing would go now.
)");
}

TEST_F(DiskCommandTest, ASimulationNamesWhatWouldGoInOrderAndWhatStaysAndRemovesNothing) {
  keepTooMuch();
  machine.toolSettings.disk.size = 60 * kMebibyte;
  EXPECT_EQ(run({"disk", "--simulate"}), 0);
  EXPECT_EQ(out, R"(These would go, in this order:
   1  over budget       30.0 MiB  8 days ago  /reports/Vistel/old.zip
   2  over budget       30.0 MiB  1 days ago  /reports/Vistel/new\n.zip
2 items, 60.0 MiB; 50.0 MiB would be left.

These stay in any case:
   20.0 MiB  3 days ago  /reports/Nexa/latest.zip  (the latest of its type)
)");
  EXPECT_EQ(machine.keptStore.kept.size(), 4U);
}

TEST_F(DiskCommandTest, FailedCallsAreMarkedWhereTheyWouldGo) {
  keep("/reports/Vistel/failed.zip", "Vistel", 200, 9);
  machine.keptStore.failedCalls = {"/reports/Vistel/failed.zip"};
  EXPECT_EQ(run({"disk", "--simulate"}), 0);
  EXPECT_THAT(out, HasSubstr("/reports/Vistel/failed.zip  (a failed call)\n"));
}

TEST_F(DiskCommandTest, ForProgramsAllOfItIsOneValue) {
  keep("/reports/Vistel/old.zip", "Vistel", 70, 8);
  keep("/reports/Vistel/new.zip", "Vistel", 70, 1).inUse = "open or locked";
  EXPECT_EQ(run({"--json", "disk"}), 0);
  EXPECT_EQ(
      out,
      R"({"kept": 146800640, "most": 104857600, "free": 419430400, "total": 1048576000, "keepFree": 157286400, )"
      R"("kinds": [{"kind": "session", "items": 2, "bytes": 146800640}], )"
      R"("types": [{"type": "Vistel", "items": 2, "bytes": 146800640}], "goes": {"items": 1, "bytes": 73400320}})"
      "\n");
  EXPECT_EQ(run({"--json", "disk", "--simulate"}), 0);
  EXPECT_THAT(out,
              HasSubstr(R"("evictions": [{"path": "/reports/Vistel/old.zip", "kind": "session", )"
                        R"("type": "Vistel", "bytes": 73400320, "changed": 1713960187, "failed": false, )"
                        R"("reason": "over budget"}], "staying": [{"path": "/reports/Vistel/new.zip")"));
}

}  // namespace
}  // namespace zal::testing
