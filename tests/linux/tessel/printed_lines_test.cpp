#include <gtest/gtest.h>

#include "platform/linux/tessel/kernel_line.h"
#include "platform/linux/tessel/record_line.h"
#include "platform/linux/tessel/syslog_line.h"
#include "tests/support/manual_run_loop.h"

namespace zal::tessel {
namespace {

using namespace std::chrono_literals;
using std::chrono::January;
using std::chrono::March;
using std::chrono::November;
using std::chrono::sys_days;

constexpr WallTime kNow = sys_days(November / 21 / 2024) + 16h + 34min + 18s + 123ms;

class TesselLinesTest : public ::testing::Test {
 protected:
  TesselLinesTest() {
    clock.zoneOffset = 1h;
    clock.setWall(kNow);
  }
  [[nodiscard]] std::string line(const std::string& text, const std::string& process = "7") const {
    return recordLine({kNow, "phone", "call", process, text}, clock);
  }
  [[nodiscard]] std::optional<WallTime> timeOf(const std::string& line) const {
    return syslogLineTime(line, clock.wallNow(), clock);
  }
  [[nodiscard]] std::string printed(const std::string& line) const {
    return printedSyslogLine(line, clock.wallNow(), clock);
  }
  zal::testing::ManualRunLoop clock;
};

TEST_F(TesselLinesTest, RecordHasLocalTimeHostNameAndProcess) {
  EXPECT_EQ(line("up"), "Nov 21 17:34:18.123 phone call[7]: up\n");
  EXPECT_EQ(line("up", ""), "Nov 21 17:34:18.123 phone call: up\n");
  EXPECT_EQ(recordLine({sys_days(March / 1 / 2024) + 2ms, "h", "n", "", ""}, clock),
            "Mar  1 01:00:00.002 h n: \n");
}

TEST_F(TesselLinesTest, FurtherLinesAreMarkedSoThatTheyPassForNoRecord) {
  EXPECT_EQ(line("one\nNov 21 17:34:18.123 phone sshd[1]: forged\n\n"),
            "Nov 21 17:34:18.123 phone call[7]: one\n"
            "    | Nov 21 17:34:18.123 phone sshd[1]: forged\n");
}

TEST_F(TesselLinesTest, ControlCharactersAreEscapedEverywhere) {
  EXPECT_EQ(line("a\x1b[2J\rb\tc"), "Nov 21 17:34:18.123 phone call[7]: a\\x1b[2J\\x0db\tc\n");
  EXPECT_EQ(recordLine({kNow, "ho\nst", "na\x1bme", "1\n2", "t"}, clock),
            "Nov 21 17:34:18.123 ho\\x0ast na\\x1bme[1\\x0a2]: t\n");
}

TEST_F(TesselLinesTest, ExactTimesAreRead) {
  EXPECT_EQ(timeOf("2024-11-21T17:34:18.123456+01:00 phone call: x"), kNow + 456us);
  EXPECT_EQ(timeOf("2024-11-21T16:34:18Z phone call: x"), kNow - 123ms);
  EXPECT_EQ(timeOf("2024-11-21T11:04:18.1-05:30 phone call: x"), kNow - 23ms);
  EXPECT_EQ(timeOf("2024-11-21T16:34:18.123000000Z phone"), kNow);
}

TEST_F(TesselLinesTest, YearlessTimesAreReadAsLocal) {
  EXPECT_EQ(timeOf("Nov 21 17:34:18 phone call: x"), kNow - 123ms);
  EXPECT_EQ(timeOf("Nov  1 00:00:00 phone call: x"), sys_days(std::chrono::October / 31 / 2024) + 23h);
}

TEST_F(TesselLinesTest, YearlessTimeIsTheLatestThatIsNotADayAhead) {
  EXPECT_EQ(timeOf("Nov 22 17:34:18 phone call: x"), kNow + 24h - 123ms);
  EXPECT_EQ(timeOf("Nov 22 17:34:19 phone call: x"), sys_days(November / 22 / 2023) + 16h + 34min + 19s);
  EXPECT_EQ(timeOf("Dec 31 23:59:59 phone call: x"), sys_days(January / 1 / 2024) - 1h - 1s);
  EXPECT_EQ(timeOf("Feb 29 12:00:00 phone call: x"), sys_days(std::chrono::February / 29 / 2024) + 11h);
}

TEST_F(TesselLinesTest, LeapDayIsFoundYearsLater) {
  clock.setWall(sys_days(November / 1 / 2027));
  EXPECT_EQ(timeOf("Feb 29 12:00:00 phone call: x"), sys_days(std::chrono::February / 29 / 2024) + 11h);
}

TEST_F(TesselLinesTest, OtherBeginningsAreNoTimes) {
  for (const char* line :
       {"", "text", " Nov 21 17:34:18 phone", "Nov 21 17:34:18", "Nov 31 17:34:18 x", "Nov 21 25:00:00 x",
        "Nov 21 17:34 x", "Foo 21 17:34:18 x", "2024-11-21T17:34:18 x", "2024-02-30T17:34:18Z x",
        "2024-11-21 17:34:18Z x", "2024-11-21T17:34:18.Z x", "2024-11-21T24:34:18Z x"}) {
    EXPECT_EQ(timeOf(line), std::nullopt) << line;
  }
}

TEST_F(TesselLinesTest, SyslogLinesGetTheSameTimesAsAllOthers) {
  EXPECT_EQ(printed("2024-11-21T17:34:18.123456+01:00 phone call[7]: x"),
            "Nov 21 17:34:18.123 phone call[7]: x\n");
  EXPECT_EQ(printed("Nov 21 17:34:18 phone call[7]: x"), "Nov 21 17:34:18 phone call[7]: x\n");
}

TEST_F(TesselLinesTest, SyslogLinesWithoutATimeAreMarked) {
  EXPECT_EQ(printed("further \x1b[2J"), "    | further \\x1b[2J\n");
}

TEST_F(TesselLinesTest, KernelMessagesAreReadAndTheirKeysPassedOver) {
  const auto message = parseKernelLine("6,339,5140900,-,caller=T1;usb 1-1: new; fast");
  ASSERT_TRUE(message);
  EXPECT_EQ(message->sinceStart, 5140900us);
  EXPECT_EQ(message->text, "usb 1-1: new; fast");
  for (const char* line :
       {" SUBSYSTEM=usb", "", "text", "6,339;x", "6,339,;x", "6,339,-1,-;x", "6,339,1x,-;x", "6;1,2,3;x"}) {
    EXPECT_FALSE(parseKernelLine(line)) << line;
  }
}

}  // namespace
}  // namespace zal::tessel
