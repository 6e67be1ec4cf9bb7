#include "session/entry_time_text.h"

#include <gtest/gtest.h>

#include <limits>

#include "tests/support/manual_run_loop.h"

namespace zal {
namespace {

class EntryTimeTextTest : public ::testing::Test {
 protected:
  testing::ManualRunLoop host;
  TimeZoneCache zone;
  EntryTimeText times{host, zone};
  std::string at(double seconds) { return std::string(times.text(wallTimeFromSeconds(seconds))); }
};

TEST_F(EntryTimeTextTest, ShowsLocalTimeDateAndZone) {
  EXPECT_EQ(at(1714651387.251), "14:03:07.251  (2024-05-02) (CEST)");
}

TEST_F(EntryTimeTextTest, GoesOnWithinAndAcrossSeconds) {
  EXPECT_EQ(at(1714651387.999), "14:03:07.999  (2024-05-02) (CEST)");
  EXPECT_EQ(at(1714651387.001), "14:03:07.001  (2024-05-02) (CEST)");
  EXPECT_EQ(at(1714651388.0), "14:03:08.000  (2024-05-02) (CEST)");
  EXPECT_EQ(at(1714651387.0), "14:03:07.000  (2024-05-02) (CEST)");
}

TEST_F(EntryTimeTextTest, CutsWhatIsLessThanAMillisecond) {
  EXPECT_EQ(at(1714651387.2519), "14:03:07.251  (2024-05-02) (CEST)");
}

TEST_F(EntryTimeTextTest, ShowsMomentsBefore1970) {
  EXPECT_EQ(at(-0.001), "01:59:59.999  (1970-01-01) (CEST)");
}

TEST_F(EntryTimeTextTest, ShowsAnyDoubleAClientCanSend) {
  constexpr double kInfinity = std::numeric_limits<double>::infinity();
  host.zoneOffset = std::chrono::hours{0};
  EXPECT_EQ(at(kInfinity), "23:59:59.000  (9999-12-31) (CEST)");
  EXPECT_EQ(at(1e300), "23:59:59.000  (9999-12-31) (CEST)");
  EXPECT_EQ(at(-kInfinity), "00:00:00.000  (0001-01-01) (CEST)");
  EXPECT_EQ(at(std::numeric_limits<double>::quiet_NaN()), "00:00:00.000  (1970-01-01) (CEST)");
}

TEST_F(EntryTimeTextTest, CallsAZoneWithoutANameUnknown) {
  host.zone = "";
  EXPECT_EQ(at(1714651387.251), "14:03:07.251  (2024-05-02) (Unknown)");
}

TEST_F(EntryTimeTextTest, KeepsTheFirstZoneForTheWholeProcess) {
  EXPECT_EQ(at(1714651387.251), "14:03:07.251  (2024-05-02) (CEST)");
  host.zone = "CET";
  EXPECT_EQ(at(1714651390.0), "14:03:10.000  (2024-05-02) (CEST)");
  EXPECT_EQ(TimeZoneCache().abbreviation(host), "CET");
}

}  // namespace
}  // namespace zal
