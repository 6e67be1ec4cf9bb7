#pragma once

#include <optional>
#include <string>

#include "platform/linux/absent/absent_radio_coexistence.h"
#include "platform/linux/alerts/alert_screens.h"
#include "platform/linux/alerts/runtime_alert_store.h"
#include "platform/linux/archive/zip_file_copier.h"
#include "platform/linux/baseband/baseband_dump_starter.h"
#include "platform/linux/blackbox/file_session_records.h"
#include "platform/linux/blackbox/unnamed_spill_files.h"
#include "platform/linux/bus_module/announced_dump_progress.h"
#include "platform/linux/bus_module/bus_module.h"
#include "platform/linux/bus_module/ipc_with_bus.h"
#include "platform/linux/bus_module/on_demand_services.h"
#include "platform/linux/bus_module/two_road_notifications.h"
#include "platform/linux/config/configuration_loader.h"
#include "platform/linux/config/toml_preference_store.h"
#include "platform/linux/crash/linux_crash_reporter.h"
#include "platform/linux/device_support/linux_device_support.h"
#include "platform/linux/dialog/dialog_screen.h"
#include "platform/linux/disk/file_kept_store.h"
#include "platform/linux/files/posix_file_placement.h"
#include "platform/linux/host/loop_host_signals.h"
#include "platform/linux/host_identity/linux_device_registry.h"
#include "platform/linux/host_identity/linux_system_version.h"
#include "platform/linux/ipc/unix_ipc_service.h"
#include "platform/linux/log/file_log_facility.h"
#include "platform/linux/log/linux_agent_log.h"
#include "platform/linux/log/mirroring_log_facility.h"
#include "platform/linux/loop/linux_clock.h"
#include "platform/linux/loop/linux_run_loop.h"
#include "platform/linux/loop/linux_work_queues.h"
#include "platform/linux/loop/loop_descriptor_watcher.h"
#include "platform/linux/notifications/runtime_directory_notifications.h"
#include "platform/linux/ping/linux_ping_facility.h"
#include "platform/linux/process/immediate_process_exit.h"
#include "platform/linux/process/posix_shell.h"
#include "platform/linux/process/procfs_process_table.h"
#include "platform/linux/process/queueing_shell.h"
#include "platform/linux/progress/runtime_dump_progress.h"
#include "platform/linux/property_list/pugixml_property_list_writer.h"
#include "platform/linux/wifi/linux_wifi_diagnostics.h"
#include "platform/main_thread_watch.h"
#include "platform/platform.h"

namespace zal {

/// All of this host's services, each made once, from the configuration that the environment leads
/// to. Made on the main thread, before there is any other. Nothing here starts a thread or waits for
/// more than a small file. Services later in the list use earlier ones, and go before them.
class LinuxPlatform {
 public:
  /// Broken pipes are errors of a write from now on, and end nothing.
  explicit LinuxPlatform(const HostEnvironment& environment);
  ~LinuxPlatform();
  LinuxPlatform(const LinuxPlatform&) = delete;
  LinuxPlatform& operator=(const LinuxPlatform&) = delete;

  [[nodiscard]] Platform& services() { return _services; }

 private:
  void _keepWhatCame();
  void _announceTermination();
  void _announceDump(DumpNews news);

  LoadedConfiguration _loaded;
  LinuxClock _clock;
  LinuxRunLoop _mainLoop;
  LinuxAgentLog _agentLog;
  std::optional<MainThreadWatch> _watchdog;
  LinuxWorkQueues _queues;
  MemoryLedger _memory;
  UnixIpcService _ipc;
  FileSessionRecords _sessionRecords;
  UnnamedSpillFiles _spillFiles;
  FileLogFacility _logFiles;
  MirroringLogFacility _logMirror;
  PlatformLogFacility& _logFacility;
  TomlPreferenceStore _preferences;
  RuntimeDirectoryNotifications _directoryNotifications;
  LocalNotifications _localNotifications;
  LinuxCrashReporter _crashReporter;
  PosixFilePlacement _files;
  FileKeptStore _keptStore;
  PosixShell _shell;
  QueueingShell _queueingShell;
  ProcfsProcessTable _processes;
  LinuxDeviceRegistry _deviceRegistry;
  LinuxSystemVersion _systemVersion;
  LoopDescriptorWatcher _descriptors;
  BasebandDumpStarter _basebandDumps;
  BusHost _busHost;
  BusModule _bus;
  IpcWithBus _ipcWithBus;
  TwoRoadNotifications _systemNotifications;
  OnDemandNetworkStatus _networkStatus;
  OnDemandCellularData _cellularData;
  OnDemandTelephony _telephony;
  LinuxPingFacility _pings;
  OnDemandAlertScreen _notificationScreen;
  DialogScreen _dialogs;
  AlertScreens _screens;
  RuntimeAlertStore _userAlerts;
  ZipFileCopier _fileCopier;
  LinuxDeviceSupport _deviceSupport;
  LinuxWifiDiagnostics _wifiDiagnostics;
  AbsentRadioCoexistence _radioCoexistence;
  PugixmlPropertyListWriter _propertyLists;
  RuntimeDumpProgress _dumpRecords;
  AnnouncedDumpProgress _dumpProgress;
  ImmediateProcessExit _processExit;
  LoopHostSignals _hostSignals;
  Platform _services;
};

}  // namespace zal
