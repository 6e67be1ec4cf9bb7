#pragma once

#include "platform/agent_log.h"
#include "platform/clock.h"
#include "platform/configuration.h"
#include "platform/crash_reporter.h"
#include "platform/device_registry.h"
#include "platform/device_support.h"
#include "platform/dump_progress.h"
#include "platform/file_copier.h"
#include "platform/file_placement.h"
#include "platform/host_signals.h"
#include "platform/ipc_listener.h"
#include "platform/kept_store.h"
#include "platform/local_notifications.h"
#include "platform/log_facility.h"
#include "platform/memory_ledger.h"
#include "platform/network_status.h"
#include "platform/ping_test.h"
#include "platform/preference_store.h"
#include "platform/process_exit.h"
#include "platform/process_table.h"
#include "platform/property_list_writer.h"
#include "platform/radio_coexistence.h"
#include "platform/run_loop.h"
#include "platform/session_records.h"
#include "platform/spill_files.h"
#include "platform/system_notifications.h"
#include "platform/system_shell.h"
#include "platform/telephony.h"
#include "platform/user_alerts.h"
#include "platform/wifi_diagnostics.h"
#include "platform/work_queue.h"

namespace zal {

/// All host services in one hand. Borrowed: the entry owns every one and outlives every user.
/// Classes ask their constructor only for those they use; this is for those that wire others.
struct Platform {
  const Configuration& configuration;
  Clock& clock;
  RunLoop& mainLoop;
  WorkQueues& queues;
  IpcService& ipc;
  PreferenceStore& preferences;
  SystemNotifications& systemNotifications;
  LocalNotifications& localNotifications;
  PlatformLogFacility& logFacility;
  AgentLog& agentLog;
  CrashReporter& crashReporter;
  FilePlacement& files;
  SystemShell& shell;
  ProcessTable& processes;
  DeviceRegistry& deviceRegistry;
  SystemVersion& systemVersion;
  NetworkStatus& networkStatus;
  Telephony& telephony;
  PingFacility& pings;
  ProcessExit& processExit;
  HostSignals& hostSignals;
  UserAlerts& userAlerts;
  FileCopier& fileCopier;
  DeviceSupport& deviceSupport;
  WifiDiagnostics& wifiDiagnostics;
  RadioCoexistence& radioCoexistence;
  PropertyListWriter& propertyLists;
  DumpProgressRecords& dumpProgress;
  SessionRecords& sessionRecords;
  MemoryLedger& memory;
  SpillFiles& spillFiles;
  KeptStore& keptStore;
};

}  // namespace zal
