#pragma once

#include <string>

#include "platform/clock.h"

namespace zal {

class AgentLog;
class CommandRunner;
class CommandTable;
class FileCollector;
class FilePlacement;
class WorkQueues;
struct Configuration;

/// Brings the logs that other processes have written into a dump. Each takes what it finds and
/// reports nothing; a directory that cannot be walked is one line in the log. Destinations are
/// directories. Any thread; keeps no state. Its services are borrowed.
class LogCollectors {
 public:
  struct Services {
    const Configuration& configuration;
    const Clock& clock;
    AgentLog& log;
    WorkQueues& queues;
    FilePlacement& placement;
    CommandRunner& commands;
    const CommandTable& table;
    FileCollector& files;
  };
  explicit LogCollectors(const Services& services) : _services(services) {}

  /// Crash reports of the relevant processes.
  void CollectCrashLogs(const std::string& destination);
  /// The baseband dump set taken after the start, else the newest before it, and the telephony
  /// daemon's own logs.
  void CollectBasebandLogs(const std::string& dumpDirectory, WallTime startTime);
  /// System logs since the start, crash reports that touch the stack, and the system log itself.
  void CollectSystemLogs(const std::string& destination, WallTime startTime);
  /// Crash reports of the network stack.
  void CollectNetworkStackLogs(const std::string& destination);
  /// For each relevant process the first snapshot since the start.
  void CollectSnapshotLogs(const std::string& destination, WallTime startTime);
  /// The push daemon's packet captures, named as such.
  void CollectPushCaptureFiles(const std::string& destination);
  void LinkFullPacketCapture(const std::string& destination);
  /// Asks the Bluetooth daemon for its logs and takes them a second later, when they are written.
  /// Returns at once.
  void CollectBluetoothLogs(const std::string& destination);
  /// The push client's logs and state; nothing where its log directory is not configured.
  void DumpPushServiceState(const std::string& destination);
  void LinkThermalLog(const std::string& destination);
  void CopyDiagnosticAndSyncLogs(const std::string& destination);

 private:
  Services _services;
};

}  // namespace zal
