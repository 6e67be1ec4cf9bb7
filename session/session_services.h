#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "platform/configuration.h"
#include "session/build_information_cache.h"
#include "session/time_zone_cache.h"

namespace zal {

class AgentLog;
class Clock;
class CommandRunner;
class DeviceRegistry;
class FileCollector;
class FilePlacement;
class LocalNotifications;
class MemoryLedger;
class NetworkStatus;
class RunLoop;
class SessionRecords;
class SessionWritings;
class SpillFiles;
class SystemVersion;
class Telephony;
class WorkQueues;
class _ZalLoggingAgentPingRunner;

/// What an ended session asks of the per-service collection.
struct CollectionRequest {
  std::string service;                ///< the session type
  std::string destination;            ///< the session directory
  std::optional<std::string> reason;  ///< "<type> - <failure reason>", when there was a failure
  bool background = true;             ///< false only when the agent ends all its sessions
  std::uint32_t flags = 0;            ///< the session's end flags
  bool isLast = false;                ///< the process ends: nothing may be left for later
  bool operator==(const CollectionRequest&) const = default;
};

/// Everything a session needs of its surroundings. Borrowed: the entry owns each and outlives every
/// session. The struct itself is lent too and must stay where it is.
struct SessionServices {
  Clock& clock;
  RunLoop& mainLoop;
  LocalNotifications& localNotifications;
  AgentLog& agentLog;
  Telephony& telephony;
  NetworkStatus& networkStatus;
  DeviceRegistry& deviceRegistry;
  SystemVersion& systemVersion;
  FilePlacement& files;
  CommandRunner& commandRunner;
  FileCollector& fileCollector;
  _ZalLoggingAgentPingRunner& pingRunner;
  const DirectoryRoots& roots;
  const Endpoints& endpoints;
  BuildInformationCache& buildInformation;
  TimeZoneCache& timeZone;
  /// Called on the main thread as the last step of writing a session's files.
  std::function<void(const CollectionRequest&)> CollectServiceLogs = [](const CollectionRequest&) {};
  SessionRecords* sessionRecords = nullptr;  ///< the black box; null: there is none
  // Where these are null, all lines stay in memory, and everything is done at once on the main thread.
  MemoryLedger* memory = nullptr;
  SpillFiles* spillFiles = nullptr;
  WorkQueues* queues = nullptr;         ///< for the way to the disk
  SessionWritings* writings = nullptr;  ///< of the files of sessions that have ended
};

}  // namespace zal
