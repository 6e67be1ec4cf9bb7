#include "collectors/command_table.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <set>

#include "collectors/command_runner.h"
#include "platform/configuration.h"
#include "tests/support/fake_services.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/temporary_directory.h"

namespace zal {
namespace {

struct NamedGroup {
  const char* name;
  CommandGroup group;
};
constexpr NamedGroup kGroups[] = {
    {"sessionCaptures", CommandGroup::sessionCaptures},
    {"networkConsole", CommandGroup::networkConsole},
    {"wifiFiles", CommandGroup::wifiFiles},
    {"networkPower", CommandGroup::networkPower},
    {"networkTables", CommandGroup::networkTables},
    {"networkNames", CommandGroup::networkNames},
    {"wifiRadio", CommandGroup::wifiRadio},
    {"networkMachine", CommandGroup::networkMachine},
    {"wifiProbe", CommandGroup::wifiProbe},
    {"networkRoutes", CommandGroup::networkRoutes},
    {"networkConsoleEnd", CommandGroup::networkConsoleEnd},
    {"handover", CommandGroup::handover},
    {"sharing", CommandGroup::sharing},
    {"registration", CommandGroup::registration},
    {"systemLogs", CommandGroup::systemLogs},
    {"bluetooth", CommandGroup::bluetooth},
    {"pushService", CommandGroup::pushService},
};

class CommandTableTest : public ::testing::Test {
 protected:
  CommandTableTest() {
    configuration.roots.SystemLogRoot = "/var/log";
    configuration.endpoints.makerWebHost = "www.maker.example";
    configuration.endpoints.searchWebHost = "www.search.example";
    configuration.endpoints.farsite = "198.51.100.7";
    configuration.endpoints.pushCourierHost1 = "1.courier.example";
    configuration.endpoints.pushCourierHost2 = "2.courier.example";
    configuration.endpoints.pushCourierHost6 = "6.courier.example";
    configuration.commands.toolDirectory = "/usr/lib/zal";
  }
  CommandTable table() { return {configuration, log}; }
  /// The line that runs for a row.
  std::string line(std::string_view id) {
    for (const CommandRow& row : CommandTable::allRows()) {
      if (row.id == id) return table().commandLine(row);
    }
    return "no row " + std::string(id);
  }
  /// The whole table as text: "[group]", then "id: line > file" a row.
  std::string everything() {
    const CommandTable commands = table();
    std::string text;
    for (const NamedGroup& named : kGroups) {
      text += std::string("[") + named.name + "]\n";
      for (const CommandRow& row : CommandTable::rows(named.group)) {
        text.append(row.id).append(": ").append(commands.commandLine(row)).append(" > ").append(row.file);
        text += "\n";
      }
    }
    return text + "[no file]\n" + commands.stopReadersCommand() + "\n";
  }

  Configuration configuration;
  testing::RecordingAgentLog log;
};

TEST_F(CommandTableTest, LiteralProfileRunsTheseLinesInThisOrder) {
  configuration.commands.profile = CommandProfile::literal;
  EXPECT_EQ(everything(), R"rows([sessionCaptures]
captures.syslog: /usr/bin/tessel -w > vistel-syslog.log
captures.syslog-before: /usr/bin/tessel -k Time ge -5m > vistel-syslog-before.log
[networkConsole]
console.syslog-start: /usr/bin/tessel -k Time ge -5m > syslog-start.log
console.lsof: /usr/sbin/lsof -n -M -P -T -w > lsof.txt
console.voltra: /usr/bin/voltra -g everything > voltra.log
console.accounts: /usr/local/bin/ledgerly listAccounts > accounts.txt
console.accounts-missing-credentials: /usr/local/bin/ledgerly missingCredentials > accounts_missing_credentials.txt
console.kill-pathwarden: /usr/bin/killall -INFO pathwarden > kill_pathwarden_command.txt
console.modrollo: /usr/sbin/modrollo > modrollo.txt
console.sysctl: /usr/sbin/sysctl -a > sysctl.txt
console.df: /bin/df -h > df-h.txt
console.pagemeter: /usr/bin/pagemeter -c 50 0.2 > pagemeter.txt
console.top: /usr/bin/top -l9 -d -r -o rprvt > top.txt
console.threads: /bin/ps axMwww -o ppid,%mem,pri,ni,vsz,rss,wchan,start,time,command > threads.txt
console.ps: /bin/ps axwww -o user,uid,pid,ppid,%cpu,%mem,pri,ni,vsz,rss,wchan,tt,stat,start,time,command > ps.txt
[wifiFiles]
wifi.log-tail: /usr/bin/tail -50000 /var/log/wifi.log > wifi.log
[networkPower]
statistics.voltra: /usr/bin/voltra -g everything > voltra.txt
[networkTables]
statistics.netstat: /usr/sbin/netstat -rna > netstat.log
statistics.netstat-wifi: /usr/sbin/netstat -q -I en0 > netstat-en0.log
statistics.netstat-cellular: /usr/sbin/netstat -q -I pdp_ip0 > netstat-pdp_ip0.log
statistics.ifconfig: /sbin/ifconfig -a -L -b -m -r -v > ifconfig.log
[networkNames]
other.confquill-dns: /usr/sbin/confquill --dns > confquill--dns.log
other.confquill-nwi: /usr/sbin/confquill --nwi > confquill--nwi.log
other.confquill-proxy: /usr/sbin/confquill --proxy > confquill--proxy.log
other.confquill-makerWebHost: /usr/sbin/confquill -d -v -r www.maker.example "" no-server > confquill--r-makerWebHost.log
other.confquill-pushCourierHost1: /usr/sbin/confquill -d -v -r 1.courier.example "" no-server > confquill--r-pushCourierHost1.log
other.confquill-pushCourierHost2: /usr/sbin/confquill -d -v -r 2.courier.example "" no-server > confquill--r-pushCourierHost2.log
other.confquill-pushCourierHost6: /usr/sbin/confquill -d -v -r 6.courier.example "" no-server > confquill--r-pushCourierHost6.log
[wifiRadio]
wifi.radiot-status: /usr/local/bin/radiot status > radiot-status.txt
[networkMachine]
other.hwnest: /usr/sbin/hwnest -w0 -l -x > hwnest.txt
other.top: /usr/bin/top -l 1 -o +command > top.txt
[wifiProbe]
wifi.airprobe-currentnet: /usr/local/bin/airprobe --currentnet > airprobe-currentnet.log
wifi.airprobe-currentnet-again: /usr/local/bin/airprobe --currentnet > airprobe-currentnet.log
wifi.airprobe-getdiags: /usr/local/bin/airprobe --getdiags > airprobe-getdiags.log
wifi.airprobe-socram: /usr/local/bin/airprobe --socram > airprobe-socram.log
wifi.airprobe-btcoex: /usr/local/bin/airprobe --btcoex > airprobe-btcoex.log
wifi.airprobe-rssibounds: /usr/local/bin/airprobe --rssibounds > airprobe-rssibounds.log
[networkRoutes]
statistics.traceroute-searchWebHost-wifi: /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 www.search.example > traceroute-searchWebHost-en0.log
statistics.traceroute-makerWebHost-wifi: /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 www.maker.example > traceroute-makerWebHost-en0.log
statistics.traceroute-farsite-wifi: /usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 198.51.100.7 > traceroute-ip-farsite-en0.log
statistics.traceroute-searchWebHost-cellular: /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 www.search.example > traceroute-searchWebHost-pdp.log
statistics.traceroute-makerWebHost-cellular: /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 www.maker.example > traceroute-makerWebHost-pdp.log
statistics.traceroute-farsite-cellular: /usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 198.51.100.7 > traceroute-ip-farsite-pdp.log
[networkConsoleEnd]
console.syslog-end: /usr/bin/tessel -k Time ge -5m > syslog-end.log
[handover]
launchpath.hoverd-status: /usr/local/bin/hovertool status > hoverd-status.txt
[sharing]
sharing.acctauth-status: /usr/local/bin/acctauth status > acctauth-status.txt
[registration]
registration.zaltool-list: /usr/local/bin/zaltool list > zaltool.txt
registration.nexatool-list: /usr/local/bin/nexatool list > nexatool.txt
registration.zaltool-info: /usr/local/bin/zaltool info > zaltool-info.txt
registration.nexad-info: /usr/bin/killall -INFO nexad > nexad-info.txt
registration.nexatool-skypairing-devices: /usr/local/bin/nexatool devices -s com.vendel.private.braid.skypairing > nexa-skypairing-devices.txt
registration.nexatool-quillet-devices: /usr/local/bin/nexatool devices -s com.vendel.torvik > nexa-quillet-devices.txt
registration.nexad-info-again: /usr/bin/killall -INFO nexad > nexad-info.txt
registration.le-devices: /usr/bin/prefread read com.vendel.PocketBluetooth.ledevices PairedDevices > le-devices.txt
[systemLogs]
system.vaultq-inet: /usr/local/bin/vaultq item class=inet > vaultq-dump-inet.txt
system.vaultq-keys: /usr/local/bin/vaultq item class=keys > vaultq-dump-keys.txt
system.vaultq-cert: /usr/local/bin/vaultq item class=cert > vaultq-dump-cert.txt
system.syslog: /usr/bin/tessel -k Time ge -10m > syslog.log
[bluetooth]
bluetooth.kill-corvell: /usr/bin/killall -USR2 Corvell > kill_corvell_usr2_command.txt
[pushService]
push.pushprobe-state: /usr/local/bin/pushprobe -dumpState > pushprobe_state.txt
[no file]
/usr/bin/killall -9 tessel
)rows");
}

TEST_F(CommandTableTest, LinuxProfileRunsTheseLinesIntoTheSameFilesInTheSameOrder) {
  EXPECT_EQ(everything(), R"rows([sessionCaptures]
captures.syslog: /usr/lib/zal/tessel -w > vistel-syslog.log
captures.syslog-before: /usr/lib/zal/tessel -k Time ge -5m > vistel-syslog-before.log
[networkConsole]
console.syslog-start: /usr/lib/zal/tessel -k Time ge -5m > syslog-start.log
console.lsof: timeout 60 /usr/bin/lsof -n -M -P -T -w > lsof.txt
console.voltra: { timeout 10 upower -d; timeout 10 grep -s . /sys/class/power_supply/*/uevent /sys/power/state /sys/power/mem_sleep /sys/class/thermal/*/type /sys/class/thermal/*/temp; timeout 10 systemd-inhibit --list --no-pager; } > voltra.log
console.accounts: timeout 10 ag-tool list-accounts > accounts.txt
console.accounts-missing-credentials: /usr/local/bin/ledgerly missingCredentials > accounts_missing_credentials.txt
console.kill-pathwarden: /usr/bin/killall -INFO pathwarden > kill_pathwarden_command.txt
console.modrollo: { lsmod || cat /proc/modules; } > modrollo.txt
console.sysctl: /usr/sbin/sysctl -a > sysctl.txt
console.df: /bin/df -h > df-h.txt
console.pagemeter: vmstat -w -n 1 10 > pagemeter.txt
console.top: /usr/bin/top -b -n 9 -d 1 -w 512 -o RES > top.txt
console.threads: /bin/ps axHwww -o ppid,%mem,pri,ni,vsz,rss,wchan:24,start,time,command > threads.txt
console.ps: /bin/ps axwww -o user,uid,pid,ppid,%cpu,%mem,pri,ni,vsz,rss,wchan,tt,stat,start,time,command > ps.txt
[wifiFiles]
wifi.log-tail: /usr/bin/tail -50000 /var/log/wifi.log > wifi.log
[networkPower]
statistics.voltra: { timeout 10 upower -d; timeout 10 grep -s . /sys/class/power_supply/*/uevent /sys/power/state /sys/power/mem_sleep /sys/class/thermal/*/type /sys/class/thermal/*/temp; timeout 10 systemd-inhibit --list --no-pager; } > voltra.txt
[networkTables]
statistics.netstat: ip route show table all > netstat.log
statistics.netstat-wifi: { ip -s -s link show dev wlan0; /usr/sbin/tc -s qdisc show dev wlan0; } > netstat-en0.log
statistics.netstat-cellular: { ip -s -s link show dev wwan0; /usr/sbin/tc -s qdisc show dev wwan0; } > netstat-pdp_ip0.log
statistics.ifconfig: ip -d -s -s address show > ifconfig.log
[networkNames]
other.confquill-dns: { cat /etc/resolv.conf; timeout 10 nmcli -f GENERAL.DEVICE,IP4.DNS,IP6.DNS device show; if command -v resolvectl > /dev/null; then timeout 10 resolvectl status --no-pager; fi; } > confquill--dns.log
other.confquill-nwi: { ip -br address show; timeout 10 nmcli -f all device show; } > confquill--nwi.log
other.confquill-proxy: { env | grep -i _proxy | sed 's|//[^/]*@|//|'; timeout 10 gsettings list-recursively org.gnome.system.proxy | grep -v authentication-password; } > confquill--proxy.log
other.confquill-makerWebHost: { host=www.maker.example; getent -s files ahosts "$host" || echo "$host: no address without asking a server"; getent -s files ahosts "$host" | awk '{print $1}' | sort -u | xargs -r -n 1 ip route get; ip route show default; ip -6 route show default; timeout 10 nmcli networking connectivity; } > confquill--r-makerWebHost.log
other.confquill-pushCourierHost1: { host=1.courier.example; getent -s files ahosts "$host" || echo "$host: no address without asking a server"; getent -s files ahosts "$host" | awk '{print $1}' | sort -u | xargs -r -n 1 ip route get; ip route show default; ip -6 route show default; timeout 10 nmcli networking connectivity; } > confquill--r-pushCourierHost1.log
other.confquill-pushCourierHost2: { host=2.courier.example; getent -s files ahosts "$host" || echo "$host: no address without asking a server"; getent -s files ahosts "$host" | awk '{print $1}' | sort -u | xargs -r -n 1 ip route get; ip route show default; ip -6 route show default; timeout 10 nmcli networking connectivity; } > confquill--r-pushCourierHost2.log
other.confquill-pushCourierHost6: { host=6.courier.example; getent -s files ahosts "$host" || echo "$host: no address without asking a server"; getent -s files ahosts "$host" | awk '{print $1}' | sort -u | xargs -r -n 1 ip route get; ip route show default; ip -6 route show default; timeout 10 nmcli networking connectivity; } > confquill--r-pushCourierHost6.log
[wifiRadio]
wifi.radiot-status: { /usr/sbin/rfkill list; timeout 10 nmcli radio all; /usr/sbin/iw phy; } > radiot-status.txt
[networkMachine]
other.hwnest: { timeout 60 lshw -quiet; timeout 30 udevadm info --export-db; timeout 30 lspci -vv; timeout 30 lsusb -v; } > hwnest.txt
other.top: /usr/bin/top -b -n 1 -w 512 -o -COMMAND > top.txt
[wifiProbe]
wifi.airprobe-currentnet: { /usr/sbin/iw dev wlan0 link; timeout 10 nmcli -f all device wifi list --rescan no; } > airprobe-currentnet.log
wifi.airprobe-currentnet-again: { /usr/sbin/iw dev wlan0 link; timeout 10 nmcli -f all device wifi list --rescan no; } > airprobe-currentnet.log
wifi.airprobe-getdiags: { /usr/sbin/iw dev wlan0 info; /usr/sbin/iw dev wlan0 station dump; /usr/sbin/iw dev wlan0 survey dump; cat /proc/net/wireless; } > airprobe-getdiags.log
wifi.airprobe-socram: { ls -l /sys/class/devcoredump; timeout 30 cat /sys/class/devcoredump/*/data; } > airprobe-socram.log
wifi.airprobe-btcoex: timeout 5 bluetoothctl show > airprobe-btcoex.log
wifi.airprobe-rssibounds: { /usr/sbin/iw dev wlan0 get power_save; /usr/sbin/iw dev wlan0 info; } > airprobe-rssibounds.log
[networkRoutes]
statistics.traceroute-searchWebHost-wifi: { pattern=wlan0; wait=5; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=www.search.example; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-searchWebHost-en0.log
statistics.traceroute-makerWebHost-wifi: { pattern=wlan0; wait=5; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=www.maker.example; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-makerWebHost-en0.log
statistics.traceroute-farsite-wifi: { pattern=wlan0; wait=5; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=198.51.100.7; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-ip-farsite-en0.log
statistics.traceroute-searchWebHost-cellular: { pattern=wwan0; wait=12; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=www.search.example; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-searchWebHost-pdp.log
statistics.traceroute-makerWebHost-cellular: { pattern=wwan0; wait=12; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=www.maker.example; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-makerWebHost-pdp.log
statistics.traceroute-farsite-cellular: { pattern=wwan0; wait=12; device=`netstat --inet -nr | grep "$pattern" | awk '{print $8}' | tail -n1`; target=198.51.100.7; if [ -n "$device" ]; then timeout 120 /usr/sbin/traceroute -i "$device" -m 10 -w "$wait" "$target"; else echo "There is no IPv4 route over $pattern."; fi; } > traceroute-ip-farsite-pdp.log
[networkConsoleEnd]
console.syslog-end: /usr/lib/zal/tessel -k Time ge -5m > syslog-end.log
[handover]
launchpath.hoverd-status: /usr/local/bin/hovertool status > hoverd-status.txt
[sharing]
sharing.acctauth-status: /usr/local/bin/acctauth status > acctauth-status.txt
[registration]
registration.zaltool-list: /usr/local/bin/zaltool list > zaltool.txt
registration.nexatool-list: /usr/local/bin/nexatool list > nexatool.txt
registration.zaltool-info: /usr/local/bin/zaltool info > zaltool-info.txt
registration.nexad-info: /usr/bin/killall -INFO nexad > nexad-info.txt
registration.nexatool-skypairing-devices: /usr/local/bin/nexatool devices -s com.vendel.private.braid.skypairing > nexa-skypairing-devices.txt
registration.nexatool-quillet-devices: /usr/local/bin/nexatool devices -s com.vendel.torvik > nexa-quillet-devices.txt
registration.nexad-info-again: /usr/bin/killall -INFO nexad > nexad-info.txt
registration.le-devices: timeout 5 bluetoothctl devices Paired > le-devices.txt
[systemLogs]
system.vaultq-inet: timeout 20 /usr/lib/zal/secretlist inet > vaultq-dump-inet.txt
system.vaultq-keys: { timeout 20 /usr/lib/zal/secretlist keys; timeout 10 keyctl show; } > vaultq-dump-keys.txt
system.vaultq-cert: timeout 20 trust list --filter=certificates > vaultq-dump-cert.txt
system.syslog: /usr/lib/zal/tessel -k Time ge -10m > syslog.log
[bluetooth]
bluetooth.kill-corvell: /usr/bin/killall -USR2 bluetoothd > kill_corvell_usr2_command.txt
[pushService]
push.pushprobe-state: /usr/local/bin/pushprobe -dumpState > pushprobe_state.txt
[no file]
/usr/bin/killall -q -9 tessel
)rows");
}

TEST_F(CommandTableTest, EveryIdStandsForOneRow) {
  std::set<std::string_view> ids;
  for (const CommandRow& row : CommandTable::allRows()) EXPECT_TRUE(ids.insert(row.id).second) << row.id;
}

TEST_F(CommandTableTest, SeveralCommandsOfOneRowAreBracedSoThatTheFileGetsAllOfThem) {
  for (const CommandRow& row : CommandTable::allRows()) {
    if (row.linux.find_first_of(";|&") == std::string_view::npos) continue;
    EXPECT_TRUE(row.linux.starts_with("{ ") && row.linux.ends_with("; }")) << row.id;
  }
}

TEST_F(CommandTableTest, ShellAcceptsEveryLineBehindItsRedirection) {
  testing::TemporaryDirectory directory;
  testing::ScriptedShell shell;
  testing::PlainFilePlacement files{"/"};
  CommandRunner runner{shell, files, log};
  for (const NamedGroup& named : kGroups) table().runInBackground(runner, named.group, "/d");
  std::string script;
  for (const std::string& command : shell.commands) script += command + "\n";
  testing::writeFile(directory / "script", script);
  EXPECT_EQ(std::system(("sh -n \"" + (directory / "script") + "\"").c_str()), 0);
}

TEST_F(CommandTableTest, GroupRunsInTheBackgroundInItsOrderIntoTheDirectory) {
  testing::ScriptedShell shell;
  testing::PlainFilePlacement files{"/"};
  CommandRunner runner{shell, files, log};
  table().runInBackground(runner, CommandGroup::sessionCaptures, "/tmp");
  EXPECT_EQ(shell.commands,
            (std::vector<std::string>{
                "/usr/lib/zal/tessel -w > \"/tmp/vistel-syslog.log\"  2>&1 &",
                "/usr/lib/zal/tessel -k Time ge -5m > \"/tmp/vistel-syslog-before.log\"  2>&1 &"}));
}

TEST_F(CommandTableTest, ConfiguredLineReplacesItsRowAloneInEitherProfile) {
  constexpr std::string_view kRow = "wifi.airprobe-currentnet-again: ";
  for (const CommandProfile profile : {CommandProfile::literal, CommandProfile::linux}) {
    configuration.commands.profile = profile;
    configuration.commands.rows.clear();
    std::string expected = everything();
    const std::size_t start = expected.find(kRow) + kRow.size();
    expected.replace(start, expected.find(" > ", start) - start, "true");
    configuration.commands.rows["wifi.airprobe-currentnet-again"] = "true";
    EXPECT_EQ(everything(), expected);
  }
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(CommandTableTest, EmptyConfiguredLineRunsNothing) {
  configuration.commands.rows["console.lsof"] = "";
  EXPECT_EQ(line("console.lsof"), "");
}

TEST_F(CommandTableTest, ConfiguredLineMayUsePlaceholdersAndBraces) {
  configuration.interfaces.wifi = "wlp2s0";
  configuration.commands.rows["console.df"] =
      "{ echo {wifi} {nothing} ${wifi} {; ping {farsite}; {SystemLogRoot}";
  EXPECT_EQ(line("console.df"), "{ echo wlp2s0 {nothing} ${wifi} {; ping 198.51.100.7; /var/log");
}

TEST_F(CommandTableTest, RowsThatDoNotExistAreNamedInOneWarning) {
  configuration.commands.rows = {{"console.lsof", "true"}, {"console.lsoff", "true"}, {"top", "true"}};
  (void)table();
  EXPECT_EQ(log.lines,
            std::vector<std::string>{"warning: [commands] names rows that do not exist: console.lsoff, top"});
}

TEST_F(CommandTableTest, ReadersAreKilledByTheNameTheyWereStartedUnder) {
  configuration.commands.systemLogReader = "tessel-7";
  EXPECT_EQ(line("captures.syslog"), "/usr/lib/zal/tessel-7 -w");
  EXPECT_EQ(table().stopReadersCommand(), "/usr/bin/killall -q -9 tessel-7");
}

TEST_F(CommandTableTest, StopOfTheReadersCanBeConfigured) {
  configuration.commands.rows["captures.stop"] = "systemctl stop reader";
  EXPECT_EQ(table().stopReadersCommand(), "systemctl stop reader");
  EXPECT_TRUE(log.lines.empty());
}

TEST_F(CommandTableTest, WithoutAToolDirectoryTheRowsOfOurProgramsStayLiteral) {
  configuration.commands.toolDirectory.clear();
  configuration.commands.systemLogReader = "tessel-7";
  EXPECT_EQ(line("captures.syslog"), "/usr/bin/tessel -w");
  EXPECT_EQ(line("system.vaultq-inet"), "/usr/local/bin/vaultq item class=inet");
  EXPECT_EQ(line("system.vaultq-keys"), "/usr/local/bin/vaultq item class=keys");
  EXPECT_EQ(line("captures.stop"), "/usr/bin/killall -9 tessel");
  EXPECT_EQ(line("console.pagemeter"), "vmstat -w -n 1 10");
}

TEST_F(CommandTableTest, MissingEndpointIsNamedInTheFileOnLinuxAndLeavesAGapInTheLiteralLine) {
  configuration.endpoints = {};
  for (const std::string name : {"makerWebHost", "searchWebHost", "farsite"}) {
    const std::string said = "echo '" + name + " is not configured in [endpoints].'";
    EXPECT_EQ(line("statistics.traceroute-" + name + "-wifi"), said);
    EXPECT_EQ(line("statistics.traceroute-" + name + "-cellular"), said);
  }
  for (const std::string name :
       {"makerWebHost", "pushCourierHost1", "pushCourierHost2", "pushCourierHost6"}) {
    EXPECT_EQ(line("other.confquill-" + name), "echo '" + name + " is not configured in [endpoints].'");
  }
  configuration.commands.profile = CommandProfile::literal;
  EXPECT_EQ(line("other.confquill-makerWebHost"), "/usr/sbin/confquill -d -v -r  \"\" no-server");
}

TEST_F(CommandTableTest, ValueThatTheShellWouldTakeApartIsQuoted) {
  configuration.roots.SystemLogRoot = "/srv/Ann's logs";
  configuration.commands.toolDirectory = "/opt/zal tools";
  configuration.interfaces.wifi = "$(reboot)";
  EXPECT_EQ(line("wifi.log-tail"), R"(/usr/bin/tail -50000 '/srv/Ann'\''s logs'/wifi.log)");
  EXPECT_EQ(line("captures.syslog"), "'/opt/zal tools'/tessel -w");
  EXPECT_EQ(line("wifi.airprobe-rssibounds"),
            "{ /usr/sbin/iw dev '$(reboot)' get power_save; /usr/sbin/iw dev '$(reboot)' info; }");
}

TEST_F(CommandTableTest, HostsAndPathsOfOrdinaryCharactersAreInsertedAsTheyAre) {
  configuration.commands.profile = CommandProfile::literal;
  configuration.endpoints.farsite = "fe80::1%eth0";
  configuration.endpoints.searchWebHost = "bücher.example";
  configuration.roots.SystemLogRoot = "~/Logs_1";
  EXPECT_TRUE(line("statistics.traceroute-farsite-wifi").ends_with(" -w 5 fe80::1%eth0"));
  EXPECT_TRUE(line("statistics.traceroute-searchWebHost-wifi").ends_with(" -w 5 bücher.example"));
  EXPECT_EQ(line("wifi.log-tail"), "/usr/bin/tail -50000 ~/Logs_1/wifi.log");
}

}  // namespace
}  // namespace zal
