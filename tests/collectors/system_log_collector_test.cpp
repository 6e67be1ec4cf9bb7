#include <gmock/gmock.h>

#include "tests/collectors/log_collectors_fixture.h"

namespace zal::testing {
namespace {

class SystemLogCollectorTest : public LogCollectorsFixture {
 protected:
  SystemLogCollectorTest() { host.configuration.commands.profile = CommandProfile::literal; }
  void putLog(const std::string& name) { put("Wireless/Reports/" + name); }
  [[nodiscard]] std::string expectedLine(const std::string& command, const std::string& file) const {
    return command + " > \"" + out + "/" + file + "\"  2>&1 &";
  }
  [[nodiscard]] std::vector<std::string> expectedCommands() const {
    return {expectedLine("/usr/local/bin/vaultq item class=inet", "vaultq-dump-inet.txt"),
            expectedLine("/usr/local/bin/vaultq item class=keys", "vaultq-dump-keys.txt"),
            expectedLine("/usr/local/bin/vaultq item class=cert", "vaultq-dump-cert.txt"),
            expectedLine("/usr/bin/tessel -k Time ge -10m", "syslog.log")};
  }
  /// The log of a collection that met nothing unusual, with a line in the middle if there is one.
  [[nodiscard]] std::vector<std::string> expectedLines(const std::string& exception = "") const {
    std::vector<std::string> expected = {"notice: Processing system logs in path: " + out};
    if (!exception.empty()) expected.push_back("warning: Exception processing system logs: " + exception);
    expected.push_back("notice: Copying diagnostic logs from: file://" +
                       host.configuration.roots.DiagnosticReportRoot + "/");
    expected.emplace_back("notice:  => Done");
    return expected;
  }
};

TEST_F(SystemLogCollectorTest, ALogStampedOneSecondBeforeTheStartStaysOutAndOneStampedAtTheStartIsTaken) {
  putLog("SystemLog-2013-01-01-100259.log");
  putLog("SystemLog-2013-01-01-100300.log");
  putLog("SystemLog-2013-01-01-110000.log");
  putLog("SystemLog-2012-12-31-110000.log");
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(gathered(), "SystemLog-2013-01-01-100300.log\nSystemLog-2013-01-01-110000.log\n");
  EXPECT_TRUE(
      isLinked("SystemLog-2013-01-01-100300.log", "Wireless/Reports/SystemLog-2013-01-01-100300.log"));
  EXPECT_EQ(lines, expectedLines());
}

TEST_F(SystemLogCollectorTest, TheLimitIsExactToTheMicrosecond) {
  putLog("SystemLog-2013-01-01-100300.log");
  logs.CollectSystemLogs(out, start + std::chrono::seconds{1});
  EXPECT_EQ(gathered(), "");
  logs.CollectSystemLogs(out, start + std::chrono::microseconds{999999});
  EXPECT_EQ(gathered(), "SystemLog-2013-01-01-100300.log\n");
}

TEST_F(SystemLogCollectorTest, OtherNamesAndOtherFormsOfTimeStayOut) {
  putLog("systemlog-2013-01-01-110000.log");
  putLog("aSystemLog-2013-01-01-110000.log");
  putLog("SystemLog-2013-01-01-11-00-00.log");
  putLog("SystemLog-2013-13-01-110000.log");
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(gathered(), "");
  EXPECT_EQ(lines, expectedLines());
}

TEST_F(SystemLogCollectorTest, ANameTooShortForATimestampEndsTheWalkAndTheCopiesAndCommandsFollow) {
  putLog("SystemLog-2013-01-01-110000.log");
  putLog("SystemLog-2013-01-01-11000a");
  putLog("SystemLog-2013-01-01-12000");  // 16 of 17 characters
  putLog("SystemLog-2013-01-01-130000.log");
  putReport("Vistel.crash");
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(gathered(), "SystemLog-2013-01-01-110000.log\nVistel.crash\n");
  EXPECT_EQ(lines, expectedLines("no room for a timestamp at position 10 of \"SystemLog-2013-01-01-12000\""));
  EXPECT_EQ(host.shell.commands, expectedCommands());
}

TEST_F(SystemLogCollectorTest, TheBareNameAloneEndsTheWalkToo) {
  putLog("SystemLog");
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(lines, expectedLines("no room for a timestamp at position 10 of \"SystemLog\""));
}

TEST_F(SystemLogCollectorTest, CrashReportsOfTheWholeStackAreCopied) {
  const std::vector<std::string> fragments = {
      "Messages", "zalavagent", "zalagent",     "ZalTrans", "ZalLogging", "nexad",    "Vistel",
      "beacond",  "ZalService", "ZalRemoteURL", "Textelle", "Orrisd",     "Dialette", "ledgerlyd",
      "vaultq",   "Shellface",  "ZalDPersist",  "Corvell",  "Plinth",     "Cardlet"};
  std::set<std::string> expected;
  for (const auto& fragment : fragments) {
    putReport("of_" + fragment + "_1.crash");
    expected.insert("of_" + fragment + "_1.crash\n");
  }
  putReport("of_VISTEL_2.crash");
  expected.insert("of_VISTEL_2.crash\n");
  for (const char* name : {"Homeframe.crash", "Webstrand.crash", "zal.crash"}) putReport(name);
  logs.CollectSystemLogs(out, start);
  std::string text;
  for (const auto& line : expected) text += line;
  EXPECT_EQ(gathered(), text);
  EXPECT_FALSE(isLinked("of_Vistel_1.crash", "Logs/Reports/of_Vistel_1.crash"));
}

TEST_F(SystemLogCollectorTest, RunsItsFourCommandsInOrder) {
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(host.shell.commands, expectedCommands());
}

TEST_F(SystemLogCollectorTest, NoScreenshotIsWritten) {
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(gathered(), "");
}

TEST_F(SystemLogCollectorTest, AnyOtherExceptionIsALineToo) {
  putLog("SystemLog-2013-01-01-110000.log");
  throwAt("SystemLog");
  logs.CollectSystemLogs(out, start);
  EXPECT_EQ(lines, expectedLines("the roof is on fire"));
}

class SnapshotLogCollectorTest : public LogCollectorsFixture {};

TEST_F(SnapshotLogCollectorTest, OfTwoSnapshotsNewerThanTheStartOnlyTheOlderIsLinked) {
  putReport("zalagent-2013-01-01-100000.ips");
  putReport("zalagent-2013-01-01-100500.ips");
  putReport("zalagent-2013-01-01-100600.ips");
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "zalagent-2013-01-01-100500.ips\n");
  EXPECT_TRUE(isLinked("zalagent-2013-01-01-100500.ips", "Logs/Reports/zalagent-2013-01-01-100500.ips"));
  EXPECT_TRUE(lines.empty());
}

TEST_F(SnapshotLogCollectorTest, EachOfTheProcessesGetsOneAndNoOther) {
  const std::string joined =
      "DialetteledgerlydplumedZalDPersistenceZalRemotestackZalTransferZalTranscodVistel";
  for (const std::string& process : {std::string("zalagent"), std::string("nexad"), std::string("zalavagent"),
                                     std::string("Orrisd"), std::string("Homeframe"), joined,
                                     std::string("Dialette"), std::string("Vistel"), std::string("Nexad")}) {
    putReport(process + "_2013-01-01-100500.ips");
  }
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), joined +
                            "_2013-01-01-100500.ips\nHomeframe_2013-01-01-100500.ips\n"
                            "Orrisd_2013-01-01-100500.ips\nnexad_2013-01-01-100500.ips\n"
                            "zalagent_2013-01-01-100500.ips\nzalavagent_2013-01-01-100500.ips\n");
}

TEST_F(SnapshotLogCollectorTest, ASnapshotExactlyAtTheLimitStaysOut) {
  putReport("nexad-2013-01-01-100259.ips");
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "");
  putReport("nexad-2013-01-01-100300.ips");
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "nexad-2013-01-01-100300.ips\n");
}

TEST_F(SnapshotLogCollectorTest, ANameTooShortForATimestampEndsTheWalk) {
  putReport("Homeframe-2013-01-01-100500.ips");
  putReport("nexad.crash");
  putReport("zalagent-2013-01-01-100500.ips");
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "Homeframe-2013-01-01-100500.ips\n");
  EXPECT_EQ(lines, std::vector<std::string>{"warning: Exception processing snapshot logs: no room for a "
                                            "timestamp at position 6 of \"nexad.crash\""});
}

TEST_F(SnapshotLogCollectorTest, AShortNameOfAProcessThatHasItsSnapshotIsNotLookedAt) {
  putReport("nexad-2013-01-01-100500.ips");
  putReport("nexad.crash");
  putReport("zalagent-2013-01-01-100500.ips");
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "nexad-2013-01-01-100500.ips\nzalagent-2013-01-01-100500.ips\n");
  EXPECT_TRUE(lines.empty());
}

TEST_F(SnapshotLogCollectorTest, AMissingDirectorySelectsNothingWithoutAMessage) {
  logs.CollectSnapshotLogs(out, start);
  EXPECT_EQ(gathered(), "");
  EXPECT_TRUE(lines.empty());
}

}  // namespace
}  // namespace zal::testing
