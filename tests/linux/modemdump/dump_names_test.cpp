#include "platform/linux/modemdump/dump_names.h"

#include <gtest/gtest.h>

#include "collectors/name_timestamp.h"
#include "platform/linux/loop/linux_clock.h"

namespace zal::modemdump {
namespace {

using namespace std::chrono_literals;
using Names = std::vector<std::string>;

TEST(DumpNamesTest, StampStandsAtTheSeventhByteAndTheShortestNameHasTwentySeven) {
  const std::string prefix =
      setPrefix({.year = 2026, .month = 1, .day = 2, .hour = 3, .minute = 4, .second = 5});
  EXPECT_EQ(prefix, "modemd-2026-01-02-03-04-05-");
  EXPECT_EQ(prefix.size(), 27U);
}

TEST(DumpNamesTest, CollectorReadsTheMomentBack) {
  const LinuxClock clock;
  const WallTime moment = WallTime{1'790'000'000s};
  EXPECT_EQ(timestampAt(newSetPrefix({}, moment + 999ms, clock) + "x", 7, kDashedTimestamp, clock), moment);
}

TEST(DumpNamesTest, StampThatIsTakenIsLeftToItsSet) {
  const LinuxClock clock;
  const WallTime moment = WallTime{1'790'000'000s};
  const std::string first = newSetPrefix({}, moment, clock);
  const std::string second = newSetPrefix({first + "note.txt"}, moment, clock);
  EXPECT_EQ(second, setPrefix(clock.localTime(moment + 1s)));
  EXPECT_EQ(newSetPrefix({first + "a", second + "b"}, moment, clock),
            setPrefix(clock.localTime(moment + 2s)));
}

TEST(DumpNamesTest, OutdatedAreTheFilesOfOurOldestSetsAlone) {
  const Names names = {"modemd-2026-01-03-00-00-00-a", "modemd-2026-01-01-00-00-00-a",
                       "modemd-2026-01-02-00-00-00-b", "modemd-2026-01-02-00-00-00-a",
                       "modemd-2025-01-02-00-00-00",   "modemd-2025-01-02-00-00-xx-a",
                       "others-2020-01-01-00-00-00-a", ".new-1-1"};
  EXPECT_EQ(outdatedNames(names, 3), Names());
  EXPECT_EQ(outdatedNames(names, 2), Names{"modemd-2026-01-01-00-00-00-a"});
  EXPECT_EQ(outdatedNames(names, 1), (Names{"modemd-2026-01-02-00-00-00-b", "modemd-2026-01-02-00-00-00-a",
                                            "modemd-2026-01-01-00-00-00-a"}));
}

}  // namespace
}  // namespace zal::modemdump
