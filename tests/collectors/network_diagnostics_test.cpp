#include "tests/collectors/network_fixture.h"

#include <cstdlib>

namespace zal {
namespace {

class NetworkDiagnosticsTest : public testing::NetworkFixture {
 protected:
  /// Requests a dump into "dump" and lets it run to its end.
  void dump(bool includePing) {
    network.ForceNetworkDump(fake.home / "dump", includePing);
    changeCaptures();
    EXPECT_TRUE(fake.queues.runNext("global.background"));
  }
  void putCaptures() {
    for (const std::string name : {"vistel-ping.log", "vistel-pdp-ping.log", "vistel-en0-ping.log",
                                   "vistel-syslog.log", "vistel-syslog-before.log"}) {
      put("tmp/" + name);
    }
  }
  /// From now on the shell is a real one, every command says this text, and each is waited for.
  void useRealCommandsThatSay(const std::string& text) {
    for (const CommandRow& row : CommandTable::allRows()) {
      fake.configuration.commands.rows[std::string(row.id)] = "echo " + text;
    }
    fake.configuration.commands.rows["captures.stop"] = "true";
    fake.shell.respond = [](const std::string& line) {
      const std::string awaited = line.ends_with("&") ? line.substr(0, line.size() - 1) : line;
      return std::system(("( " + awaited + " ) 2> /dev/null").c_str());
    };
  }
};

TEST_F(NetworkDiagnosticsTest, WholeDumpRunsInThisOrder) {
  putCaptures();
  put("tmp/vistel_thermal_log.txt");
  put("System/Network/com.vendel.wifi.plist");
  put("System/Logs/wifi-driver.log");
  put("System/Logs/wifi_driver.log");
  put("System/Logs/wifiFirmwareLoader.log");
  put("System/Reports/WiFi/scan.txt");
  put("var/log/wavetrap/trap.txt");
  dump(true);
  EXPECT_EQ(happened(), R"events(run /usr/bin/killall -9 tessel
run /usr/bin/tessel -k Time ge -5m > "~/dump/Console/syslog-start.log"  2>&1 &
run /usr/sbin/lsof -n -M -P -T -w > "~/dump/Console/lsof.txt"  2>&1 &
run /usr/bin/voltra -g everything > "~/dump/Console/voltra.log"  2>&1 &
run /usr/local/bin/ledgerly listAccounts > "~/dump/Console/accounts.txt"  2>&1 &
run /usr/local/bin/ledgerly missingCredentials > "~/dump/Console/accounts_missing_credentials.txt"  2>&1 &
run /usr/bin/killall -INFO pathwarden > "~/dump/Console/kill_pathwarden_command.txt"  2>&1 &
run /usr/sbin/modrollo > "~/dump/Console/modrollo.txt"  2>&1 &
run /usr/sbin/sysctl -a > "~/dump/Console/sysctl.txt"  2>&1 &
run /bin/df -h > "~/dump/Console/df-h.txt"  2>&1 &
run /usr/bin/pagemeter -c 50 0.2 > "~/dump/Console/pagemeter.txt"  2>&1 &
run /usr/bin/top -l9 -d -r -o rprvt > "~/dump/Console/top.txt"  2>&1 &
run /bin/ps axMwww -o ppid,%mem,pri,ni,vsz,rss,wchan,start,time,command > "~/dump/Console/threads.txt"  2>&1 &
run /bin/ps axwww -o user,uid,pid,ppid,%cpu,%mem,pri,ni,vsz,rss,wchan,tt,stat,start,time,command > "~/dump/Console/ps.txt"  2>&1 &
file ~/tmp/vistel_thermal_log.txt
file ~/System/Network/com.vendel.wifi.plist
run /usr/bin/tail -50000 ~/System/Logs/wifi.log > "~/dump/WiFi/wifi.log"  2>&1 &
file ~/System/Logs/wifi-driver.log
file ~/System/Logs/wifi_driver.log
file ~/System/Logs/wifiFirmwareLoader.log
file ~/System/Reports/WiFi/scan.txt
file ~/var/log/wavetrap/trap.txt
plist ~/dump/CT/CTState.plist
file ~/tmp/vistel-ping.log
file ~/tmp/vistel-pdp-ping.log
file ~/tmp/vistel-en0-ping.log
file ~/tmp/vistel-syslog.log
file ~/tmp/vistel-syslog-before.log
run /usr/bin/voltra -g everything > "~/dump/Statistics/voltra.txt"  2>&1 &
run /usr/sbin/netstat -rna > "~/dump/Statistics/netstat.log"  2>&1 &
run /usr/sbin/netstat -q -I en0 > "~/dump/Statistics/netstat-en0.log"  2>&1 &
run /usr/sbin/netstat -q -I pdp_ip0 > "~/dump/Statistics/netstat-pdp_ip0.log"  2>&1 &
run /sbin/ifconfig -a -L -b -m -r -v > "~/dump/Statistics/ifconfig.log"  2>&1 &
run /usr/sbin/confquill --dns > "~/dump/Other/confquill--dns.log"  2>&1 &
run /usr/sbin/confquill --nwi > "~/dump/Other/confquill--nwi.log"  2>&1 &
run /usr/sbin/confquill --proxy > "~/dump/Other/confquill--proxy.log"  2>&1 &
run /usr/sbin/confquill -d -v -r maker.example "" no-server > "~/dump/Other/confquill--r-makerWebHost.log"  2>&1 &
run /usr/sbin/confquill -d -v -r courier1.example "" no-server > "~/dump/Other/confquill--r-pushCourierHost1.log"  2>&1 &
run /usr/sbin/confquill -d -v -r courier2.example "" no-server > "~/dump/Other/confquill--r-pushCourierHost2.log"  2>&1 &
run /usr/sbin/confquill -d -v -r courier6.example "" no-server > "~/dump/Other/confquill--r-pushCourierHost6.log"  2>&1 &
run /usr/local/bin/radiot status > "~/dump/WiFi/radiot-status.txt"  2>&1 &
run /usr/sbin/hwnest -w0 -l -x > "~/dump/Other/hwnest.txt"  2>&1 &
run /usr/bin/top -l 1 -o +command > "~/dump/Other/top.txt"  2>&1 &
run /usr/local/bin/airprobe --currentnet > "~/dump/WiFi/airprobe-currentnet.log"  2>&1 &
run /usr/local/bin/airprobe --currentnet > "~/dump/WiFi/airprobe-currentnet.log"  2>&1 &
run /usr/local/bin/airprobe --getdiags > "~/dump/WiFi/airprobe-getdiags.log"  2>&1 &
run /usr/local/bin/airprobe --socram > "~/dump/WiFi/airprobe-socram.log"  2>&1 &
run /usr/local/bin/airprobe --btcoex > "~/dump/WiFi/airprobe-btcoex.log"  2>&1 &
run /usr/local/bin/airprobe --rssibounds > "~/dump/WiFi/airprobe-rssibounds.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 search.example > "~/dump/Statistics/traceroute-searchWebHost-en0.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 maker.example > "~/dump/Statistics/traceroute-makerWebHost-en0.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 192.0.2.13 > "~/dump/Statistics/traceroute-ip-farsite-en0.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 search.example > "~/dump/Statistics/traceroute-searchWebHost-pdp.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 maker.example > "~/dump/Statistics/traceroute-makerWebHost-pdp.log"  2>&1 &
run /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 192.0.2.13 > "~/dump/Statistics/traceroute-ip-farsite-pdp.log"  2>&1 &
ping <default gateway> over wifi
ping report.example over wifi
ping report.example over cellular
run /usr/bin/tessel -k Time ge -5m > "~/dump/Console/syslog-end.log"  2>&1 &
)events");
  EXPECT_EQ(fake.agentLog.lines, (std::vector<std::string>{"notice: **** Generating network logs ****",
                                                           "notice: **** End Generating network logs ****"}));
}

TEST_F(NetworkDiagnosticsTest, DumpPingsTheGatewayAndTheReportServerOverBothForEightSeconds) {
  dump(true);
  EXPECT_EQ(
      finishedPings(),
      "ping <default gateway> over wifi for 8 into ~/dump/Statistics/ping-gateway.log\n"
      "ping report.example over wifi for 8 into ~/dump/Statistics/ping-en0-report.example.log\n"
      "ping report.example over cellular for 8 into ~/dump/Statistics/ping-pdp_ip0-report.example.log\n");
}

TEST_F(NetworkDiagnosticsTest, DumpWithoutPingsStillPingsTheGateway) {
  dump(false);
  EXPECT_EQ(finishedPings(),
            "ping <default gateway> over wifi for 8 into ~/dump/Statistics/ping-gateway.log\n");
}

TEST_F(NetworkDiagnosticsTest, ReportServerThatIsNotConfiguredKeepsItsPings) {
  fake.configuration.endpoints.reportServer.clear();
  dump(true);
  EXPECT_EQ(finishedPings(),
            "ping <default gateway> over wifi for 8 into ~/dump/Statistics/ping-gateway.log\n"
            "ping  over wifi for 8 into ~/dump/Statistics/ping-en0-reportHost.log\n"
            "ping  over cellular for 8 into ~/dump/Statistics/ping-pdp_ip0-reportHost.log\n");
}

TEST_F(NetworkDiagnosticsTest, PreferencePingtestMakesADumpWithoutPingsTheSameAsOneWithThem) {
  putCaptures();
  prefer("pingtest", true);
  dump(false);
  const std::string preferred = happened();
  const std::string preferredTree = tree("dump");
  fake.preferences.stored.clear();
  fake.preferences.synchronize("com.vendel.logging");
  std::filesystem::remove_all(fake.home / "dump");
  events.clear();
  putCaptures();
  dump(true);
  EXPECT_EQ(preferred, happened());
  EXPECT_EQ(preferredTree, tree("dump"));
  EXPECT_NE(preferred.find("ping report.example over cellular"), std::string::npos);
}

TEST_F(NetworkDiagnosticsTest, RequestStopsTheCapturesFirstAndLeavesTheRestToTheBackgroundQueue) {
  network.ForceNetworkDump(fake.home / "dump", true);
  EXPECT_EQ(happened(), "run /usr/bin/killall -9 tessel\n");
  EXPECT_FALSE(std::filesystem::exists(fake.home / "dump"));
  EXPECT_EQ(fake.queues.readyJobs("global.background"), 1U);
  EXPECT_EQ(fake.queues.readyJobs("global.default"), 0U);
  fake.queues.runAll();
  EXPECT_TRUE(std::filesystem::exists(fake.home / "dump"));
}

TEST_F(NetworkDiagnosticsTest, PreferenceCountsAtTheMomentOfTheRequest) {
  network.ForceNetworkDump(fake.home / "dump", false);
  prefer("pingtest", true);
  fake.queues.runAll();
  EXPECT_EQ(fake.pings.tests.size(), 1U);
}

TEST_F(NetworkDiagnosticsTest, DumpIntoAMissingDirectoryMakesItAndItsFiveDirectoriesForEveryone) {
  network.CollectNetworkLogs(fake.home / "a/b/dump", false);
  EXPECT_EQ(tree("a"),
            "b/\nb/dump/\nb/dump/CT/\nb/dump/CT/CTState.plist\nb/dump/Console/\nb/dump/Other/\n"
            "b/dump/Statistics/\nb/dump/WiFi/\n");
  for (const std::string name : {"a", "a/b", "a/b/dump", "a/b/dump/CT", "a/b/dump/Console", "a/b/dump/Other",
                                 "a/b/dump/Statistics", "a/b/dump/WiFi"}) {
    EXPECT_EQ(std::filesystem::status(fake.home / name).permissions(), std::filesystem::perms::all) << name;
  }
}

TEST_F(NetworkDiagnosticsTest, CapturesGoToStatisticsAndTheLookBackToConsole) {
  putCaptures();
  dump(true);
  EXPECT_EQ(tree("dump/Statistics"),
            "vistel-en0-ping.log\nvistel-pdp-ping.log\nvistel-ping.log\nvistel-syslog.log\n");
  EXPECT_EQ(tree("dump/Console"), "vistel-syslog-before.log\n");
  EXPECT_EQ(tree("tmp"), "");
}

TEST_F(NetworkDiagnosticsTest, DumpWithoutPingsLeavesTheGatewayCaptureWhereItIs) {
  putCaptures();
  dump(false);
  EXPECT_EQ(tree("dump/Statistics"), "vistel-en0-ping.log\nvistel-pdp-ping.log\nvistel-syslog.log\n");
  EXPECT_EQ(tree("tmp"), "vistel-ping.log\n");
}

TEST_F(NetworkDiagnosticsTest, SecondDumpIntoTheSameDirectoryTruncatesTheFilesAndKeepsBothCaptures) {
  useRealCommandsThatSay("the first run said more");
  putCaptures();
  dump(true);
  useRealCommandsThatSay("second");
  putCaptures();
  dump(true);
  EXPECT_EQ(tree("dump"), R"tree(CT/
CT/CTState.plist
Console/
Console/accounts.txt
Console/accounts_missing_credentials.txt
Console/df-h.txt
Console/kill_pathwarden_command.txt
Console/lsof.txt
Console/modrollo.txt
Console/pagemeter.txt
Console/ps.txt
Console/sysctl.txt
Console/syslog-end.log
Console/syslog-start.log
Console/threads.txt
Console/top.txt
Console/vistel-syslog-before-2.log
Console/vistel-syslog-before.log
Console/voltra.log
Other/
Other/confquill--dns.log
Other/confquill--nwi.log
Other/confquill--proxy.log
Other/confquill--r-makerWebHost.log
Other/confquill--r-pushCourierHost1.log
Other/confquill--r-pushCourierHost2.log
Other/confquill--r-pushCourierHost6.log
Other/hwnest.txt
Other/top.txt
Statistics/
Statistics/ifconfig.log
Statistics/netstat-en0.log
Statistics/netstat-pdp_ip0.log
Statistics/netstat.log
Statistics/traceroute-ip-farsite-en0.log
Statistics/traceroute-ip-farsite-pdp.log
Statistics/traceroute-makerWebHost-en0.log
Statistics/traceroute-makerWebHost-pdp.log
Statistics/traceroute-searchWebHost-en0.log
Statistics/traceroute-searchWebHost-pdp.log
Statistics/vistel-en0-ping-2.log
Statistics/vistel-en0-ping.log
Statistics/vistel-pdp-ping-2.log
Statistics/vistel-pdp-ping.log
Statistics/vistel-ping-2.log
Statistics/vistel-ping.log
Statistics/vistel-syslog-2.log
Statistics/vistel-syslog.log
Statistics/voltra.txt
WiFi/
WiFi/airprobe-btcoex.log
WiFi/airprobe-currentnet.log
WiFi/airprobe-getdiags.log
WiFi/airprobe-rssibounds.log
WiFi/airprobe-socram.log
WiFi/radiot-status.txt
WiFi/wifi.log
)tree");
  for (const std::string name :
       {"Console/lsof.txt", "Statistics/netstat.log", "Other/hwnest.txt", "WiFi/wifi.log"}) {
    EXPECT_EQ(testing::readFile(fake.home / ("dump/" + name)), "second\n") << name;
  }
}

TEST_F(NetworkDiagnosticsTest, DirectoryThatCannotBeMadeLosesItsOwnFilesOnly) {
  put("dump/Statistics");
  putCaptures();
  useRealCommandsThatSay("here");
  dump(true);
  EXPECT_EQ(testing::readFile(fake.home / "dump/Statistics"), "content of dump/Statistics\n");
  EXPECT_EQ(testing::readFile(fake.home / "dump/Console/syslog-end.log"), "here\n");
  EXPECT_EQ(tree("dump/Other"),
            "confquill--dns.log\nconfquill--nwi.log\nconfquill--proxy.log\n"
            "confquill--r-makerWebHost.log\nconfquill--r-pushCourierHost1.log\n"
            "confquill--r-pushCourierHost2.log\nconfquill--r-pushCourierHost6.log\n"
            "hwnest.txt\ntop.txt\n");
  EXPECT_EQ(tree("tmp"), "vistel-en0-ping.log\nvistel-pdp-ping.log\nvistel-ping.log\nvistel-syslog.log\n");
  ASSERT_EQ(fake.agentLog.lines.size(), 3U);
  EXPECT_EQ(shortened(fake.agentLog.lines[1]),
            "warning: Failed to make the directory ~/dump/Statistics: File exists");
}

TEST_F(NetworkDiagnosticsTest, DriverLogIsTakenInEitherSpelling) {
  put("System/Logs/wifi-driver.log");
  put("System/Logs/wifi_driver.log");
  network.CollectWiFiFiles(fake.home / "wifi");
  EXPECT_EQ(tree("wifi"), "wifi-driver.log\nwifi_driver.log\n");
  EXPECT_TRUE(std::filesystem::equivalent(fake.home / "wifi/wifi_driver.log",
                                          fake.home / "System/Logs/wifi_driver.log"));
}

TEST_F(NetworkDiagnosticsTest, DriverLogAmongTheReportsGoesBeforeTheOneAmongTheLogs) {
  put("System/Reports/WiFi/wifi-driver.log");
  put("System/Logs/wifi-driver.log");
  put("System/Reports/WiFi/wifi_driver.log");
  put("System/Logs/wifi_driver.log");
  network.CollectWiFiFiles(fake.home / "wifi");
  ASSERT_GE(events.size(), 5U);
  EXPECT_EQ(std::vector<std::string>(events.begin() + 1, events.begin() + 5),
            (std::vector<std::string>{
                "file ~/System/Reports/WiFi/wifi-driver.log", "file ~/System/Reports/WiFi/wifi_driver.log",
                "file ~/System/Logs/wifi-driver.log", "file ~/System/Logs/wifi_driver.log"}));
  for (const std::string name : {"wifi-driver.log", "wifi_driver.log"}) {
    EXPECT_EQ(testing::readFile(fake.home / ("wifi/" + name)),
              "content of System/Reports/WiFi/" + name + "\n");
  }
}

TEST_F(NetworkDiagnosticsTest, WifiLogIsCutByACommandAndTheRestIsLinkedOrCopied) {
  put("System/Logs/wifi.log");
  put("tmp/vistel_thermal_log.txt");
  put("System/Network/com.vendel.wifi.plist");
  put("System/Reports/WiFi/scan.txt");
  put("System/Reports/WiFi/old.log.gz");
  put("var/log/wavetrap/deep/trap.txt");
  std::filesystem::create_directories(fake.home / "wifi");
  network.CollectWiFiFiles(fake.home / "wifi");
  EXPECT_EQ(tree("wifi"), "com.vendel.wifi.plist\ndeep/\ndeep/trap.txt\nscan.txt\nvistel_thermal_log.txt\n");
  EXPECT_TRUE(std::filesystem::equivalent(fake.home / "wifi/vistel_thermal_log.txt",
                                          fake.home / "tmp/vistel_thermal_log.txt"));
  EXPECT_FALSE(
      std::filesystem::equivalent(fake.home / "wifi/scan.txt", fake.home / "System/Reports/WiFi/scan.txt"));
  EXPECT_EQ(happened(), R"(file ~/tmp/vistel_thermal_log.txt
file ~/System/Network/com.vendel.wifi.plist
run /usr/bin/tail -50000 ~/System/Logs/wifi.log > "~/wifi/wifi.log"  2>&1 &
file ~/System/Reports/WiFi/scan.txt
file ~/var/log/wavetrap/deep
)");
}

TEST_F(NetworkDiagnosticsTest, WifiFilesThatAreNotThereAreSkippedWithoutAWord) {
  std::filesystem::remove_all(fake.home / "System");
  std::filesystem::remove_all(fake.home / "var");
  network.CollectWiFiFiles(fake.home / "wifi");
  EXPECT_EQ(happened(), "run /usr/bin/tail -50000 ~/System/Logs/wifi.log > \"~/wifi/wifi.log\"  2>&1 &\n");
  EXPECT_TRUE(fake.agentLog.lines.empty());
}

}  // namespace
}  // namespace zal
