#include "tests/dump/prepared_host.h"

namespace zal::testing {
namespace {

// Relative to the host's home. Collections begin at 14:03:07.
constexpr const char* kFiles[] = {
    // the media daemon
    "Media/Jitter-call.log",
    "Media/jitter-other.log",
    "Media/other-Jitter.log",
    // logs of the user
    "Logs/RadioMarshal-1.log",
    "Logs/other-RadioMarshal.log",
    "Logs/kinsight-1.log",
    "Logs/KinsightHeuristic-BM-1.log",
    "Logs/Kinsight-other.log",
    "Logs/nearwaved-latest.log",
    "Logs/nearwaved-other.log",
    "Logs/tcpdump_beacond_en0-0",
    "Logs/tcpdump_beacond_pdp_ip0-1",
    "Logs/tcpdump_beacond_en0-other",
    "Logs/tcpdump_en0-full.pcap",
    "Logs/Handover/.hidden",
    "Logs/Handover/handover.log",
    "Logs/com.vendel.sharewell/share.log",
    "Logs/LocalPreview/LocalPreview.log",
    "Logs/LocalPreview/other.log",
    "Logs/Bluetooth/bluetooth.log",
    "Logs/Bluetooth/other.log.gz",
    "Logs/Bluetooth/.other",
    "Logs/Bluetooth/inner/deep.log",
    "Logs/PocketBluetooth/pocket.log",
    "Logs/Tandemsync/tandem.log",
    "Logs/Phone Tandem/Phone Tandem.log",
    "Logs/Phone/Phone.log",
    "Logs/Phone/Phone.log.4.zip",
    "Logs/Phone/Phone-Event.log",
    "Logs/Phone/other.log",
    "Logs/Vistel/Vistel.log",
    "Logs/Vistel/Vistel.log.3.zip",
    "Logs/Vistel/Vistel.log.4.zip",
    "Logs/Nexa/Nexa.log",
    "Logs/NexaIDQuery/NexaIDQuery.log",
    "Logs/Transport/Transport.log",
    "Logs/Messages/Messages.log",
    "Logs/Registration/Registration.log",
    "Logs/Registration/Registration.log.9.zip",
    "Logs/Registration/Registration-Event.log.9.zip",
    "Logs/Registration/Registration.log.10.zip",
    // crash reports of the user
    "Logs/Reports/RadioMarshal-report.txt",
    "Logs/Reports/Vistel-1.crash",
    "Logs/Reports/vistel-other.crash",
    "Logs/Reports/Orrisd_2024-05-02-140001_phone.crash",
    "Logs/Reports/Dialette-1.crash",
    "Logs/Reports/Cardlet-1.crash",
    "Logs/Reports/Webstrand-user.crash",
    "Logs/Reports/other.crash",
    "Logs/Reports/zalagent-2024-05-02-140200.other",
    "Logs/Reports/zalagent-2024-05-02-140308.snapshot",
    "Logs/Reports/zalagent-2024-05-02-140309.other",
    "Logs/Reports/Homeframe-2024-05-02-140310.snapshot",
    "Logs/Reports/DiagnosticLogs/cloudsync.log",
    "Logs/Reports/DiagnosticLogs/other.log",
    "Logs/Reports/DiagnosticLogs/Accounts/accounts.log",
    "Logs/Reports/DiagnosticLogs/Accounts/beacond.log.gz",
    // the system
    "System/Reports/tcpdump-1.pcap",
    "System/Reports/other-tcpdump.pcap",
    "System/Reports/com.vendel.networking.pelliton-1.log",
    "System/Reports/com.vendel.networking.other.log",
    "System/Reports/setkey.log",
    "System/Reports/Webstrand-system.crash",
    "System/Reports/WiFi/wifi-driver.log",
    "System/Reports/WiFi/capture.pcap",
    "System/Reports/WiFi/other.log.gz",
    "System/Logs/tetherd.log",
    "System/Logs/wifi_driver.log",
    "System/Logs/wifiFirmwareLoader.log",
    "System/Logs/other.log",
    "System/Network/com.vendel.wifi.plist",
    "System/Network/other.plist",
    "Root/Reports/Webstrand-root.crash",
    "var/log/wavetrap/wave.log",
    "LocationCache/cache.db",
    "LocationCache/.hidden",
    "LocationCache/tiles/tile.bin",
    "uart.log",
    // telephony
    "Wireless/Logs/Telvane.log",
    "Wireless/Logs/other.log",
    "Wireless/Reports/Webstrand-wireless.crash",
    "Wireless/Reports/SystemLog-2024-05-02-140200.other",
    "Wireless/Reports/SystemLog-2024-05-02-140307.log",
    "Wireless/Reports/Baseband/bbdump-2024-05-02-14-00-00-other.bin",
    "Wireless/Reports/Baseband/bbdump-2024-05-02-14-03-09-core.bin",
    "Wireless/Reports/Baseband/bbdump-2024-05-02-14-03-09-info.txt",
    // what the deployment names
    "Paired/first.log",
    "Paired/second.log",
    "Paired/devices/device.plist",
    "PushClient/courier.log",
    // what other processes leave for a while
    "tmp/uart-1.log",
    "tmp/other-uart.log",
    "tmp/vistel_thermal_log.txt",
    "tmp/vistel-ping.log",
    "tmp/vistel-pdp-ping.log",
    "tmp/vistel-en0-ping.log",
    "tmp/vistel-syslog.log",
    "tmp/vistel-syslog-before.log",
    "tmp/other.log",
};

int runAsAShell(const std::string& commandLine) {
  const std::size_t begin = commandLine.find(" > \"");
  if (begin == std::string::npos) return 0;
  const std::size_t end = commandLine.find("\"  2>&1", begin);
  std::ofstream(commandLine.substr(begin + 4, end - begin - 4));
  return 0;
}

}  // namespace

void prepareHost(FakePlatform& host) {
  for (const char* file : kFiles) writeFile(host.home / file, std::string("content of ") + file + "\n");
  host.configuration.collection = {.cloudSyncLog = "cloudsync.log",
                                   .pairedDeviceLog1 = host.home / "Paired/first.log",
                                   .pairedDeviceLog2 = host.home / "Paired/second.log",
                                   .pairedDeviceDirectory = host.home / "Paired/devices",
                                   .pushLogDirectory = host.home / "PushClient"};
  host.configuration.endpoints = {.reportServer = "report.example",
                                  .cellPingServer = "192.0.2.1",
                                  .wifiPingServer = "192.0.2.2",
                                  .makerWebHost = "maker.example",
                                  .searchWebHost = "search.example",
                                  .farsite = "192.0.2.3",
                                  .pushCourierHost1 = "courier1.example",
                                  .pushCourierHost2 = "courier2.example",
                                  .pushCourierHost6 = "courier6.example"};
  host.configuration.interfaces = {.wifi = "en0", .cellular = "pdp_ip0"};
  host.radioCoexistence.present = true;
  host.telephony.reachable = true;
  host.shell.respond = runAsAShell;
}

}  // namespace zal::testing
