#include "collectors/network_diagnostics.h"

#include <optional>
#include <utility>

#include "collectors/cellular_snapshot.h"
#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/ping_runner.h"
#include "collectors/report_host_name.h"
#include "platform/agent_log.h"
#include "platform/configuration.h"
#include "platform/device_support.h"
#include "platform/preference_store.h"
#include "platform/system_shell.h"
#include "platform/work_queue.h"

namespace zal {
namespace {

// The ping runner's own long default.
constexpr double kUntilStopped = 0;
constexpr double kDumpPingSeconds = 8.0;
constexpr std::nullopt_t kGateway = std::nullopt;

constexpr const char* kWifiPingCapture = "vistel-ping.log";
constexpr const char* kCellularPingCapture = "vistel-pdp-ping.log";
constexpr const char* kForeignPingCapture = "vistel-en0-ping.log";  // another process leaves it
constexpr const char* kSystemLogCapture = "vistel-syslog.log";
constexpr const char* kSystemLogBeforeCapture = "vistel-syslog-before.log";
constexpr const char* kThermalLog = "vistel_thermal_log.txt";

struct DumpDirectories {
  explicit DumpDirectories(const std::string& directory)
      : top(directory),
        cellular(directory + "/CT"),
        wifi(directory + "/WiFi"),
        other(directory + "/Other"),
        statistics(directory + "/Statistics"),
        console(directory + "/Console") {}
  std::string top, cellular, wifi, other, statistics, console;
};

// What is aimed at a directory that cannot be made is lost, so the log says why.
void makeDirectories(const DumpDirectories& paths, FileCollector& files, AgentLog& log) {
  for (const std::string& path :
       {paths.top, paths.other, paths.cellular, paths.wifi, paths.statistics, paths.console}) {
    if (const std::error_code error = files.makeDirectory(path)) {
      log.warning("Failed to make the directory " + path + ": " + error.message());
    }
  }
}

}  // namespace

NetworkDiagnostics::NetworkDiagnostics(const Services& services)
    : _services(services), _captures(services.queues.makeSerial("network.captures")) {}

NetworkDiagnostics::~NetworkDiagnostics() = default;

bool NetworkDiagnostics::VideoCallsOverCellularAvailable() {
  return _services.deviceSupport.videoCallsOverCellularAvailable();
}

bool NetworkDiagnostics::_isPingTestPreferred() {
  return _services.preferences.boolean("com.vendel.logging", "pingtest").value_or(false);
}

void NetworkDiagnostics::StopCaptures() {
  _services.pings.stopAllTests();
  _services.shell.PerformSystem(_services.table.stopReadersCommand());
}

void NetworkDiagnostics::stopCapturesThen(std::function<void()> then) {
  _captures->async([this, then = std::move(then)] {
    StopCaptures();
    then();
  });
}

void NetworkDiagnostics::StartSessionCaptures(std::uint64_t flags) {
  const bool withPings = _isPingTestPreferred() || (flags & kBeginFlagPingCaptures) != 0;
  stopCapturesThen([this, flags, withPings] {
    const std::string& directory = _services.configuration.roots.TemporaryRoot;
    if (withPings) {
      if (VideoCallsOverCellularAvailable()) {
        _services.pings.addPingTest(_services.configuration.endpoints.cellPingServer, kUntilStopped, false,
                                    directory, kCellularPingCapture);
      }
      _services.pings.addPingTest(kGateway, kUntilStopped, true, directory, kWifiPingCapture);
    }
    if ((flags & kBeginFlagSystemLogCaptures) != 0) {
      _services.table.runInBackground(_services.commands, CommandGroup::sessionCaptures, directory);
    }
  });
}

void NetworkDiagnostics::StartServerPings(const std::string& wifiOutputPath,
                                          const std::string& cellularOutputPath) {
  stopCapturesThen([this, wifiOutputPath, cellularOutputPath] {
    const Endpoints& endpoints = _services.configuration.endpoints;
    if (VideoCallsOverCellularAvailable()) {
      _services.pings.addPingTest(endpoints.cellPingServer, kUntilStopped, false, cellularOutputPath);
    }
    _services.pings.addPingTest(endpoints.wifiPingServer, kUntilStopped, true, wifiOutputPath);
  });
}

void NetworkDiagnostics::ForceNetworkDump(const std::string& directory, bool includePing) {
  stopCapturesThen(
      [this, directory, withPings = wantsPings(includePing)] { queueNetworkDump(directory, withPings); });
}

void NetworkDiagnostics::queueNetworkDump(const std::string& directory, bool withPings) {
  _services.queues.global(QueuePriority::background).async([this, directory, withPings] {
    CollectNetworkLogs(directory, withPings);
  });
}

void NetworkDiagnostics::CollectNetworkLogs(const std::string& directory, bool includePing) {
  _services.log.notice("**** Generating network logs ****");
  const DumpDirectories paths(directory);
  makeDirectories(paths, _services.files, _services.log);
  _runCommands(CommandGroup::networkConsole, paths.console);
  CollectWiFiFiles(paths.wifi);
  _services.cellular.WriteCellularState(paths.cellular);
  _moveCaptures(paths.statistics, paths.console, includePing);
  _runCommands(CommandGroup::networkPower, paths.statistics);
  _runCommands(CommandGroup::networkTables, paths.statistics);
  _runCommands(CommandGroup::networkNames, paths.other);
  _runCommands(CommandGroup::wifiRadio, paths.wifi);
  _runCommands(CommandGroup::networkMachine, paths.other);
  _runCommands(CommandGroup::wifiProbe, paths.wifi);
  _runCommands(CommandGroup::networkRoutes, paths.statistics);
  _startDumpPings(paths.statistics, includePing);
  _runCommands(CommandGroup::networkConsoleEnd, paths.console);
  _services.log.notice("**** End Generating network logs ****");
}

void NetworkDiagnostics::CollectWiFiFiles(const std::string& directory) {
  const DirectoryRoots& roots = _services.configuration.roots;
  FileCollector& files = _services.files;
  files.LinkFileIntoDirectory(roots.TemporaryRoot + "/" + kThermalLog, directory, "");
  files.LinkFileIntoDirectory(roots.NetworkConfigRoot + "/com.vendel.wifi.plist", directory, "");
  _runCommands(CommandGroup::wifiFiles, directory);
  // Drivers differ in how they spell the name and in where they write: whatever exists is taken.
  for (const std::string& log : {
           roots.SystemReportRoot + "/WiFi/wifi-driver.log",
           roots.SystemReportRoot + "/WiFi/wifi_driver.log",
           roots.SystemLogRoot + "/wifi-driver.log",
           roots.SystemLogRoot + "/wifi_driver.log",
           roots.SystemLogRoot + "/wifiFirmwareLoader.log",
       }) {
    files.LinkFileIntoDirectory(log, directory, "");
  }
  files.CopyDirectoryContents(roots.SystemReportRoot + "/WiFi", directory);
  files.CopyDirectoryContents(roots.VarLogRoot + "/wavetrap", directory);
}

void NetworkDiagnostics::_runCommands(CommandGroup group, const std::string& directory) {
  _services.table.runInBackground(_services.commands, group, directory);
}

// The live system log is looked for in Statistics and its look-back in Console.
void NetworkDiagnostics::_moveCaptures(const std::string& statistics, const std::string& console,
                                       bool includePing) {
  const std::string captures = _services.configuration.roots.TemporaryRoot + "/";
  FileCollector& files = _services.files;
  if (includePing) files.MoveFileIntoDirectory(captures + kWifiPingCapture, statistics, "");
  for (const char* name : {kCellularPingCapture, kForeignPingCapture, kSystemLogCapture}) {
    files.MoveFileIntoDirectory(captures + name, statistics, "");
  }
  files.MoveFileIntoDirectory(captures + kSystemLogBeforeCapture, console, "");
}

void NetworkDiagnostics::_startDumpPings(const std::string& statistics, bool includePing) {
  _services.pings.addPingTest(kGateway, kDumpPingSeconds, true, statistics, "ping-gateway.log");
  if (!includePing) return;
  const std::string& server = _services.configuration.endpoints.reportServer;
  const std::string host = reportHostInFileNames(_services.configuration.endpoints);
  _services.pings.addPingTest(server, kDumpPingSeconds, true, statistics, "ping-en0-" + host + ".log");
  _services.pings.addPingTest(server, kDumpPingSeconds, false, statistics, "ping-pdp_ip0-" + host + ".log");
}

}  // namespace zal
