#pragma once

#include <string>

#include "platform/platform.h"
#include "tests/support/fake_dump_services.h"
#include "tests/support/fake_ipc.h"
#include "tests/support/fake_kept_store.h"
#include "tests/support/fake_services.h"
#include "tests/support/fake_session_records.h"
#include "tests/support/fake_spill_files.h"
#include "tests/support/manual_run_loop.h"
#include "tests/support/manual_work_queues.h"
#include "tests/support/plain_file_placement.h"
#include "tests/support/scripted_pings.h"
#include "tests/support/temporary_directory.h"

namespace zal::testing {

class FakeHostSignals : public HostSignals {
 public:
  ~FakeHostSignals() override;
  std::function<void()> terminate, reload;
  void onTerminate(std::function<void()> handler) override { terminate = std::move(handler); }
  void onReload(std::function<void()> handler) override { reload = std::move(handler); }
};

/// A whole host for one test: manual time, real files below one temporary home, everything else
/// faked. Each service can be reached by itself, and all together as a Platform.
class FakePlatform {
 public:
  FakePlatform();
  ~FakePlatform();

  TemporaryDirectory home;
  Configuration configuration;
  ManualRunLoop host;  ///< clock and main loop
  ManualWorkQueues queues{host};
  FakeIpcService ipc;
  FakePreferences preferences;
  FakeSystemNotifications systemNotifications;
  LocalNotifications localNotifications;
  RecordingLogFacility logFacility;
  RecordingAgentLog agentLog;
  RecordingCrashReporter crashReporter;
  PlainFilePlacement files{home.path()};
  ScriptedShell shell;
  FakeProcessTable processes;
  FakeDeviceRegistry deviceRegistry;
  FakeSystemVersion systemVersion;
  FakeNetworkStatus networkStatus;
  FakeTelephony telephony;
  ScriptedPings pings;
  RecordingProcessExit processExit;
  FakeHostSignals hostSignals;
  FakeUserAlerts userAlerts;
  FakeFileCopier fileCopier;
  FakeDeviceSupport deviceSupport;
  FakeWifiDiagnostics wifiDiagnostics;
  FakeRadioCoexistence radioCoexistence;
  FakePropertyListWriter propertyLists;
  RecordingDumpProgress dumpProgress;
  FakeSessionRecords sessionRecords;
  MemoryLedger memory{configuration.memory};
  FakeSpillFiles spillFiles;
  FakeKeptStore keptStore;

  Platform platform = with(preferences);

  /// The same host with other preferences.
  [[nodiscard]] Platform with(PreferenceStore& store);
};

}  // namespace zal::testing
