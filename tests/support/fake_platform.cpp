#include "tests/support/fake_platform.h"

#include <filesystem>

namespace zal::testing {

FakePlatform::FakePlatform() {
  DirectoryRoots& roots = configuration.roots;
  roots.UserLogRoot = home / "Logs";
  roots.MobileLogRoot = home / "Logs";
  roots.DiagnosticReportRoot = home / "Logs/Reports";
  roots.WirelessLogRoot = home / "Wireless/Logs";
  roots.WirelessReportRoot = home / "Wireless/Reports";
  roots.RootReportRoot = home / "Root/Reports";
  roots.SystemLogRoot = home / "System/Logs";
  roots.SystemReportRoot = home / "System/Reports";
  roots.NetworkConfigRoot = home / "System/Network";
  roots.MediaLogCacheDir = home / "Media";
  roots.LocationCacheDir = home / "LocationCache";
  roots.UartLogFile = home / "uart.log";
  roots.VarLogRoot = home / "var/log";
  roots.TemporaryRoot = home / "tmp";
  std::filesystem::create_directories(roots.TemporaryRoot);
}

Platform FakePlatform::with(PreferenceStore& store) {
  return {.configuration = configuration,
          .clock = host,
          .mainLoop = host,
          .queues = queues,
          .ipc = ipc,
          .preferences = store,
          .systemNotifications = systemNotifications,
          .localNotifications = localNotifications,
          .logFacility = logFacility,
          .agentLog = agentLog,
          .crashReporter = crashReporter,
          .files = files,
          .shell = shell,
          .processes = processes,
          .deviceRegistry = deviceRegistry,
          .systemVersion = systemVersion,
          .networkStatus = networkStatus,
          .telephony = telephony,
          .pings = pings,
          .processExit = processExit,
          .hostSignals = hostSignals,
          .userAlerts = userAlerts,
          .fileCopier = fileCopier,
          .deviceSupport = deviceSupport,
          .wifiDiagnostics = wifiDiagnostics,
          .radioCoexistence = radioCoexistence,
          .propertyLists = propertyLists,
          .dumpProgress = dumpProgress,
          .sessionRecords = sessionRecords,
          .memory = memory,
          .spillFiles = spillFiles,
          .keptStore = keptStore};
}

// The ends of all fakes, and with each what the compiler makes once for a class: test files that use
// them would otherwise make it again and again.
FakePlatform::~FakePlatform() = default;
FakeHostSignals::~FakeHostSignals() = default;
RecordingAgentLog::~RecordingAgentLog() = default;
RecordingLogFacility::~RecordingLogFacility() = default;
FakePreferences::~FakePreferences() = default;
FakeSystemNotifications::~FakeSystemNotifications() = default;
RecordingCrashReporter::~RecordingCrashReporter() = default;
ScriptedShell::~ScriptedShell() = default;
FakeProcessTable::~FakeProcessTable() = default;
FakeDeviceRegistry::~FakeDeviceRegistry() = default;
FakeSystemVersion::~FakeSystemVersion() = default;
FakeNetworkStatus::~FakeNetworkStatus() = default;
FakeTelephony::~FakeTelephony() = default;
RecordingProcessExit::~RecordingProcessExit() = default;
FakeUserAlerts::~FakeUserAlerts() = default;
FakeFileCopier::~FakeFileCopier() = default;
FakeDeviceSupport::~FakeDeviceSupport() = default;
FakeWifiDiagnostics::~FakeWifiDiagnostics() = default;
FakeRadioCoexistence::~FakeRadioCoexistence() = default;
FakePropertyListWriter::~FakePropertyListWriter() = default;
RecordingDumpProgress::~RecordingDumpProgress() = default;
FakeSessionRecords::~FakeSessionRecords() = default;
FakeKeptStore::~FakeKeptStore() = default;
FakeMessage::~FakeMessage() = default;
FakePeer::~FakePeer() = default;
FakeIpcService::~FakeIpcService() = default;
ScriptedPings::~ScriptedPings() {
  for (const auto& test : tests) test->handler = nullptr;
}
PlainFilePlacement::~PlainFilePlacement() = default;

}  // namespace zal::testing
