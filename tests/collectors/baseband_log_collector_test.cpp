#include "tests/collectors/log_collectors_fixture.h"

namespace zal::testing {
namespace {

class BasebandLogCollectorTest : public LogCollectorsFixture {
 protected:
  void putDump(const std::string& name) { put("Wireless/Reports/Baseband/" + name); }
};

TEST_F(BasebandLogCollectorTest, TheSetStampedAfterTheStartIsTaken) {
  putDump("bb-log-2013-01-01-10-00-00.bin");
  putDump("bb-log-2013-01-01-10-05-00.bin");
  putDump("bb-txt-2013-01-01-10-05-00.txt");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(),
            "Baseband/\nBaseband/bb-log-2013-01-01-10-05-00.bin\n"
            "Baseband/bb-txt-2013-01-01-10-05-00.txt\n");
  EXPECT_TRUE(isLinked("Baseband/bb-log-2013-01-01-10-05-00.bin",
                       "Wireless/Reports/Baseband/bb-log-2013-01-01-10-05-00.bin"));
  EXPECT_EQ(lines, std::vector<std::string>{"notice: Processing baseband logs"});
}

TEST_F(BasebandLogCollectorTest, WithOnlyASetStampedBeforeTheStartThatSetIsTaken) {
  putDump("bb-log-2013-01-01-10-00-00.bin");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\nBaseband/bb-log-2013-01-01-10-00-00.bin\n");
}

TEST_F(BasebandLogCollectorTest, WithShorterNamesOnlyNothingIsTakenButTheTelephonyLogsAreLinked) {
  putDump("bb-log-2013-01-01-10-05-00");  // 26 characters
  putDump("short");
  put("Wireless/Logs/Telvane.log");
  put("Wireless/Logs/other.log");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\nTelvane.log\n");
  EXPECT_TRUE(isLinked("Telvane.log", "Wireless/Logs/Telvane.log"));
  EXPECT_EQ(lines, std::vector<std::string>{"notice: Processing baseband logs"});
}

TEST_F(BasebandLogCollectorTest, ASetStampedExactlyAtTheLimitCountsAsBefore) {
  putDump("bb-log-2013-01-01-10-02-59.bin");
  putDump("bb-log-2013-01-01-10-03-00.bin");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\nBaseband/bb-log-2013-01-01-10-03-00.bin\n");
}

TEST_F(BasebandLogCollectorTest, OfSeveralSetsOnTheSameSideTheLastByNameIsTaken) {
  // In order of names "x" comes last, though its time is the earlier one.
  putDump("a-file-2013-01-01-10-06-00.bin");
  putDump("x-file-2013-01-01-10-05-00.bin");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\nBaseband/x-file-2013-01-01-10-05-00.bin\n");
}

TEST_F(BasebandLogCollectorTest, EveryNameThatHoldsTheStampIsTakenWhereverItStands) {
  putDump("bb-log-2013-01-01-10-05-00.bin");
  putDump("2013-01-01-10-05-00");
  putDump("trace of 2013-01-01-10-05-00.x");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(),
            "Baseband/\nBaseband/2013-01-01-10-05-00\nBaseband/bb-log-2013-01-01-10-05-00.bin\n"
            "Baseband/trace of 2013-01-01-10-05-00.x\n");
}

TEST_F(BasebandLogCollectorTest, NamesWhoseStampDoesNotParseAreNeverChosen) {
  putDump("bb-log-2013-02-30-10-05-00.bin");
  putDump("bb-log-not-a-timestamp-at-all.bin");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\n");
  EXPECT_EQ(lines, std::vector<std::string>{"notice: Processing baseband logs"});
}

TEST_F(BasebandLogCollectorTest, EachLinkThatFailsIsALineThatSaysCopied) {
  putDump("bb-log-2013-01-01-10-05-00.bin");
  putDump("bb-txt-2013-01-01-10-05-00.txt");
  put("out/Baseband/bb-log-2013-01-01-10-05-00.bin");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(lines, (std::vector<std::string>{
                       "notice: Processing baseband logs",
                       "warning:  ** FAILED Copied from " + host.configuration.roots.WirelessReportRoot +
                           "/Baseband/bb-log-2013-01-01-10-05-00.bin to " + out + "/Baseband"}));
  EXPECT_EQ(readFile(out + "/Baseband/bb-log-2013-01-01-10-05-00.bin"),
            "out/Baseband/bb-log-2013-01-01-10-05-00.bin");
}

TEST_F(BasebandLogCollectorTest, WithoutAnyDirectoryTheDestinationIsStillMade) {
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\n");
  EXPECT_EQ(lines, std::vector<std::string>{"notice: Processing baseband logs"});
}

TEST_F(BasebandLogCollectorTest, AnExceptionIsALineAndTheTelephonyLogsFollow) {
  putDump("bb-log-2013-01-01-10-05-00.bin");
  put("Wireless/Logs/Telvane.log");
  throwAt("Baseband");
  logs.CollectBasebandLogs(out, start);
  EXPECT_EQ(gathered(), "Baseband/\nTelvane.log\n");
  EXPECT_EQ(lines,
            (std::vector<std::string>{"notice: Processing baseband logs",
                                      "warning: Exception processing baseband logs: the roof is on fire"}));
}

}  // namespace
}  // namespace zal::testing
