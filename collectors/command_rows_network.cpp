#include "collectors/command_rows.h"
#include "collectors/joined_text.h"

namespace zal::command_rows {
namespace {

constexpr std::string_view kMaker = "{makerWebHost}";
constexpr std::string_view kSearch = "{searchWebHost}";
constexpr std::string_view kFarsite = "{farsite}";
constexpr std::string_view kCourier1 = "{pushCourierHost1}";
constexpr std::string_view kCourier2 = "{pushCourierHost2}";
constexpr std::string_view kCourier6 = "{pushCourierHost6}";

// Named one by one: reading some of the files in /sys/power waits for events.
constexpr std::string_view kPower =
    "{ timeout 10 upower -d; "
    "timeout 10 grep -s . /sys/class/power_supply/*/uevent /sys/power/state /sys/power/mem_sleep "
    "/sys/class/thermal/*/type /sys/class/thermal/*/temp; "
    "timeout 10 systemd-inhibit --list --no-pager; }";

constexpr std::string_view kAskLiteral = "/usr/sbin/confquill -d -v -r ";
constexpr std::string_view kAskLiteralEnd = " \"\" no-server";
constexpr std::string_view kWithHost = "{ host=";
constexpr std::string_view kAskNoServer =
    "; getent -s files ahosts \"$host\" || echo \"$host: no address without asking a server\"; "
    "getent -s files ahosts \"$host\" | awk '{print $1}' | sort -u | xargs -r -n 1 ip route get; "
    "ip route show default; ip -6 route show default; timeout 10 nmcli networking connectivity; }";

constexpr std::string_view kCurrentNetwork =
    "{ /usr/sbin/iw dev {wifi} link; timeout 10 nmcli -f all device wifi list --rescan no; }";

// The two blanks after the pattern belong to the literal lines.
constexpr std::string_view kTraceLiteralWifi =
    "/usr/sbin/traceroute -i `netstat -f inet -nr | grep en0  | awk '{print $6}' | tail -n1` -m 10 -w 5 ";
constexpr std::string_view kTraceLiteralCellular =
    "/usr/sbin/traceroute -i `netstat -f inet -nr | grep pdp_ip  | awk '{print $6}' | tail -n1` -m 10 -w 12 ";
// Without an interface traceroute would take the next option for one and complain about the rest.
constexpr std::string_view kTraceWifi =
    "{ pattern={wifi}; wait=5; device=`netstat --inet -nr | grep \"$pattern\" | awk '{print $8}' | tail "
    "-n1`; target=";
constexpr std::string_view kTraceCellular =
    "{ pattern={cellular}; wait=12; device=`netstat --inet -nr | grep \"$pattern\" | awk '{print $8}' | tail "
    "-n1`; target=";
constexpr std::string_view kTraceEnd =
    "; if [ -n \"$device\" ]; then timeout 120 /usr/sbin/traceroute -i \"$device\" -m 10 -w \"$wait\" "
    "\"$target\"; "
    "else echo \"There is no IPv4 route over $pattern.\"; fi; }";

constexpr CommandRow kSessionCapturesRows[] = {
    {"captures.syslog", "/usr/bin/tessel -w", "{tools}/{reader} -w", "vistel-syslog.log"},
    {"captures.syslog-before", "/usr/bin/tessel -k Time ge -5m", "{tools}/{reader} -k Time ge -5m",
     "vistel-syslog-before.log"},
};

constexpr CommandRow kNetworkConsoleRows[] = {
    {"console.syslog-start", "/usr/bin/tessel -k Time ge -5m", "{tools}/{reader} -k Time ge -5m",
     "syslog-start.log"},
    {"console.lsof", "/usr/sbin/lsof -n -M -P -T -w", "timeout 60 /usr/bin/lsof -n -M -P -T -w", "lsof.txt"},
    {"console.voltra", "/usr/bin/voltra -g everything", kPower, "voltra.log"},
    {"console.accounts", "/usr/local/bin/ledgerly listAccounts", "timeout 10 ag-tool list-accounts",
     "accounts.txt"},
    {"console.accounts-missing-credentials",
     "/usr/local/bin/ledgerly missingCredentials",
     {},
     "accounts_missing_credentials.txt"},
    {"console.kill-pathwarden", "/usr/bin/killall -INFO pathwarden", {}, "kill_pathwarden_command.txt"},
    {"console.modrollo", "/usr/sbin/modrollo", "{ lsmod || cat /proc/modules; }", "modrollo.txt"},
    {"console.sysctl", "/usr/sbin/sysctl -a", {}, "sysctl.txt"},
    {"console.df", "/bin/df -h", {}, "df-h.txt"},
    {"console.pagemeter", "/usr/bin/pagemeter -c 50 0.2", "vmstat -w -n 1 10", "pagemeter.txt"},
    {"console.top", "/usr/bin/top -l9 -d -r -o rprvt", "/usr/bin/top -b -n 9 -d 1 -w 512 -o RES", "top.txt"},
    {"console.threads", "/bin/ps axMwww -o ppid,%mem,pri,ni,vsz,rss,wchan,start,time,command",
     "/bin/ps axHwww -o ppid,%mem,pri,ni,vsz,rss,wchan:24,start,time,command", "threads.txt"},
    {"console.ps",
     "/bin/ps axwww -o user,uid,pid,ppid,%cpu,%mem,pri,ni,vsz,rss,wchan,tt,stat,start,time,command",
     {},
     "ps.txt"},
};

constexpr CommandRow kWifiFilesRows[] = {
    {"wifi.log-tail", "/usr/bin/tail -50000 {SystemLogRoot}/wifi.log", {}, "wifi.log"},
};

constexpr CommandRow kNetworkPowerRows[] = {
    {"statistics.voltra", "/usr/bin/voltra -g everything", kPower, "voltra.txt"},
};

constexpr CommandRow kNetworkTablesRows[] = {
    {"statistics.netstat", "/usr/sbin/netstat -rna", "ip route show table all", "netstat.log"},
    {"statistics.netstat-wifi", "/usr/sbin/netstat -q -I en0",
     "{ ip -s -s link show dev {wifi}; /usr/sbin/tc -s qdisc show dev {wifi}; }", "netstat-en0.log"},
    {"statistics.netstat-cellular", "/usr/sbin/netstat -q -I pdp_ip0",
     "{ ip -s -s link show dev {cellular}; /usr/sbin/tc -s qdisc show dev {cellular}; }",
     "netstat-pdp_ip0.log"},
    {"statistics.ifconfig", "/sbin/ifconfig -a -L -b -m -r -v", "ip -d -s -s address show", "ifconfig.log"},
};

constexpr CommandRow kNetworkNamesRows[] = {
    {"other.confquill-dns", "/usr/sbin/confquill --dns",
     "{ cat /etc/resolv.conf; timeout 10 nmcli -f GENERAL.DEVICE,IP4.DNS,IP6.DNS device show; if command -v "
     "resolvectl > /dev/null; then timeout 10 resolvectl status --no-pager; fi; }",
     "confquill--dns.log"},
    {"other.confquill-nwi", "/usr/sbin/confquill --nwi",
     "{ ip -br address show; timeout 10 nmcli -f all device show; }", "confquill--nwi.log"},
    {"other.confquill-proxy", "/usr/sbin/confquill --proxy",
     "{ env | grep -i _proxy | sed 's|//[^/]*@|//|'; timeout 10 gsettings list-recursively "
     "org.gnome.system.proxy | grep -v authentication-password; }",
     "confquill--proxy.log"},
    {"other.confquill-makerWebHost", kJoined<kAskLiteral, kMaker, kAskLiteralEnd>,
     kJoined<kWithHost, kMaker, kAskNoServer>, "confquill--r-makerWebHost.log"},
    {"other.confquill-pushCourierHost1", kJoined<kAskLiteral, kCourier1, kAskLiteralEnd>,
     kJoined<kWithHost, kCourier1, kAskNoServer>, "confquill--r-pushCourierHost1.log"},
    {"other.confquill-pushCourierHost2", kJoined<kAskLiteral, kCourier2, kAskLiteralEnd>,
     kJoined<kWithHost, kCourier2, kAskNoServer>, "confquill--r-pushCourierHost2.log"},
    {"other.confquill-pushCourierHost6", kJoined<kAskLiteral, kCourier6, kAskLiteralEnd>,
     kJoined<kWithHost, kCourier6, kAskNoServer>, "confquill--r-pushCourierHost6.log"},
};

constexpr CommandRow kWifiRadioRows[] = {
    {"wifi.radiot-status", "/usr/local/bin/radiot status",
     "{ /usr/sbin/rfkill list; timeout 10 nmcli radio all; /usr/sbin/iw phy; }", "radiot-status.txt"},
};

constexpr CommandRow kNetworkMachineRows[] = {
    {"other.hwnest", "/usr/sbin/hwnest -w0 -l -x",
     "{ timeout 60 lshw -quiet; timeout 30 udevadm info --export-db; timeout 30 lspci -vv; timeout 30 lsusb "
     "-v; }",
     "hwnest.txt"},
    {"other.top", "/usr/bin/top -l 1 -o +command", "/usr/bin/top -b -n 1 -w 512 -o -COMMAND", "top.txt"},
};

constexpr CommandRow kWifiProbeRows[] = {
    {"wifi.airprobe-currentnet", "/usr/local/bin/airprobe --currentnet", kCurrentNetwork,
     "airprobe-currentnet.log"},
    {"wifi.airprobe-currentnet-again", "/usr/local/bin/airprobe --currentnet", kCurrentNetwork,
     "airprobe-currentnet.log"},
    {"wifi.airprobe-getdiags", "/usr/local/bin/airprobe --getdiags",
     "{ /usr/sbin/iw dev {wifi} info; /usr/sbin/iw dev {wifi} station dump; /usr/sbin/iw dev {wifi} survey "
     "dump; cat /proc/net/wireless; }",
     "airprobe-getdiags.log"},
    {"wifi.airprobe-socram", "/usr/local/bin/airprobe --socram",
     "{ ls -l /sys/class/devcoredump; timeout 30 cat /sys/class/devcoredump/*/data; }",
     "airprobe-socram.log"},
    {"wifi.airprobe-btcoex", "/usr/local/bin/airprobe --btcoex", "timeout 5 bluetoothctl show",
     "airprobe-btcoex.log"},
    {"wifi.airprobe-rssibounds", "/usr/local/bin/airprobe --rssibounds",
     "{ /usr/sbin/iw dev {wifi} get power_save; /usr/sbin/iw dev {wifi} info; }", "airprobe-rssibounds.log"},
};

constexpr CommandRow kNetworkRoutesRows[] = {
    {"statistics.traceroute-searchWebHost-wifi", kJoined<kTraceLiteralWifi, kSearch>,
     kJoined<kTraceWifi, kSearch, kTraceEnd>, "traceroute-searchWebHost-en0.log"},
    {"statistics.traceroute-makerWebHost-wifi", kJoined<kTraceLiteralWifi, kMaker>,
     kJoined<kTraceWifi, kMaker, kTraceEnd>, "traceroute-makerWebHost-en0.log"},
    {"statistics.traceroute-farsite-wifi", kJoined<kTraceLiteralWifi, kFarsite>,
     kJoined<kTraceWifi, kFarsite, kTraceEnd>, "traceroute-ip-farsite-en0.log"},
    {"statistics.traceroute-searchWebHost-cellular", kJoined<kTraceLiteralCellular, kSearch>,
     kJoined<kTraceCellular, kSearch, kTraceEnd>, "traceroute-searchWebHost-pdp.log"},
    {"statistics.traceroute-makerWebHost-cellular", kJoined<kTraceLiteralCellular, kMaker>,
     kJoined<kTraceCellular, kMaker, kTraceEnd>, "traceroute-makerWebHost-pdp.log"},
    {"statistics.traceroute-farsite-cellular", kJoined<kTraceLiteralCellular, kFarsite>,
     kJoined<kTraceCellular, kFarsite, kTraceEnd>, "traceroute-ip-farsite-pdp.log"},
};

constexpr CommandRow kNetworkConsoleEndRows[] = {
    {"console.syslog-end", "/usr/bin/tessel -k Time ge -5m", "{tools}/{reader} -k Time ge -5m",
     "syslog-end.log"},
};

}  // namespace

const std::span<const CommandRow> kSessionCaptures = kSessionCapturesRows;
const std::span<const CommandRow> kNetworkConsole = kNetworkConsoleRows;
const std::span<const CommandRow> kWifiFiles = kWifiFilesRows;
const std::span<const CommandRow> kNetworkPower = kNetworkPowerRows;
const std::span<const CommandRow> kNetworkTables = kNetworkTablesRows;
const std::span<const CommandRow> kNetworkNames = kNetworkNamesRows;
const std::span<const CommandRow> kWifiRadio = kWifiRadioRows;
const std::span<const CommandRow> kNetworkMachine = kNetworkMachineRows;
const std::span<const CommandRow> kWifiProbe = kWifiProbeRows;
const std::span<const CommandRow> kNetworkRoutes = kNetworkRoutesRows;
const std::span<const CommandRow> kNetworkConsoleEnd = kNetworkConsoleEndRows;

const CommandRow kStopReaders = {
    "captures.stop", "/usr/bin/killall -9 tessel", "/usr/bin/killall -q -9 {reader}", {}};

}  // namespace zal::command_rows
