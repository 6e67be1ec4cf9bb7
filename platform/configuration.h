#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/directory_roots.h"

namespace zal {

/// Hosts that diagnostics talk to: `[endpoints]`. An empty one is not configured.
struct Endpoints {
  std::string reportServer;    ///< ping target of a session's ping request
  std::string cellPingServer;  ///< relay server pinged over the cellular interface
  std::string wifiPingServer;  ///< second server, pinged over Wi-Fi
  // Names and addresses that the network dump asks for and traces.
  std::string makerWebHost;
  std::string searchWebHost;
  std::string farsite;  ///< an IPv4 address far away
  std::string pushCourierHost1;
  std::string pushCourierHost2;
  std::string pushCourierHost6;
};

/// Interface names as this device calls them: `[interfaces]`.
struct Interfaces {
  std::string wifi = "wlan0";
  std::string cellular = "wwan0";
};

/// `[ipc]`
struct IpcSettings {
  std::string group;                              ///< its members may talk to the agent; empty: none
  std::uint32_t maximumPayload = 16U << 20U;      ///< bytes of one request
  std::uint32_t maximumReplyBacklog = 1U << 20U;  ///< unread reply bytes after which a peer is dropped
};

/// `[bus]`
struct BusSettings {
  bool enabled = true;  ///< false: nothing that speaks D-Bus is loaded, and every service of a bus is absent
};

/// `[blackbox]`
struct BlackBoxSettings {
  bool enabled = true;  ///< what sessions accept survives the end of the process
  bool sync = false;    ///< and, once a client was told that it is safe, the end of the power
};

/// `[memory]`: bytes beyond which lines of sessions wait on the disk for the end of their session.
struct MemorySettings {
  std::uint64_t session = 192ULL << 20U;  ///< of one session
  std::uint64_t peer = 224ULL << 20U;     ///< of all sessions together, as far as one client sent it
  std::uint64_t total = 256ULL << 20U;
};

/// `[disk]`: how much of it the agent keeps for later.
struct DiskSettings {
  std::uint64_t size = 0;       ///< bytes at most; 0: the share decides
  std::uint32_t share = 10;     ///< percent of the file system at most; 0: no limit by size
  std::uint32_t keepFree = 15;  ///< percent of the file system that stay free; 0: it may fill up
};

#ifndef NDEBUG
inline constexpr std::uint32_t kUsualHoldLimit = 50;
#else
inline constexpr std::uint32_t kUsualHoldLimit = 0;
#endif

/// `[watchdog]`
struct WatchdogSettings {
  std::uint32_t limit =
      kUsualHoldLimit;  ///< milliseconds that one thing may hold the main thread; 0: any time
};

/// `[log]`
struct LogSettings {
  std::vector<std::string> categories;       ///< switched on; LIRRA_LOG_CATEGORIES adds to them
  std::uint64_t rotationSize = 4ULL << 20U;  ///< bytes after which a log file is rotated
  std::uint32_t maximumOpenFiles = 64;
  bool journal = true;  ///< records go to the journal as well, where there is one
  std::string journalSocket = "/run/systemd/journal/socket";
};

/// Which command lines the collectors run: `[commands] profile`.
enum class CommandProfile {
  literal,  ///< those of the platform that the collections were laid out for
  linux,    ///< what Linux has in their place, where it has something
};

/// `[commands]`: the profile, the tools' whereabouts, and any row by its id.
struct CommandSettings {
  CommandProfile profile = CommandProfile::linux;
  std::string toolDirectory;                ///< of our own helper programs; no slash at the end
  std::string systemLogReader = "tessel";   ///< the log reader's program name: what is killed by name
  std::map<std::string, std::string> rows;  ///< row id to the command line that replaces it
};

/// `[alerts]`
struct AlertSettings {
  bool screen = true;  ///< shown to the person where there is a screen, besides the runtime directory
};

/// `[collection]`: single places that a collection takes logs from; an empty one is skipped.
struct CollectionSettings {
  std::string cloudSyncLog;  ///< file name below DiagnosticReportRoot/DiagnosticLogs
  std::string pairedDeviceLog1;
  std::string pairedDeviceLog2;
  std::string pairedDeviceDirectory;
  std::string pushLogDirectory;
};

/// How archives are made: `[archive] compression`.
enum class ArchiveCompression {
  small,  ///< no larger than what the usual tools make
  fast,   ///< a little larger, in a fraction of the time
};

/// Everything a deployment can set; the defaults are the product's. Read once at start.
struct Configuration {
  DirectoryRoots roots;
  Endpoints endpoints;
  Interfaces interfaces;
  IpcSettings ipc;
  BusSettings bus;
  BlackBoxSettings blackBox;
  MemorySettings memory;
  DiskSettings disk;
  WatchdogSettings watchdog;
  LogSettings log;
  CommandSettings commands;
  CollectionSettings collection;
  AlertSettings alerts;
  ArchiveCompression archiveCompression = ArchiveCompression::fast;
  bool internalInstall = false;                ///< `[device] internalInstall`: the maker's own people use it
  std::optional<bool> videoCallsOverCellular;  ///< `[device]`; nothing: the modem's state says it
  std::string systemVersionFile;               ///< property list; empty: os-release and the kernel answer
  /// For tests only: the agent's six minutes of idling shortened. `[testing] inactivityLimit`, seconds.
  std::optional<std::chrono::milliseconds> inactivityLimit;
  /// For tests only: the wait between a collection's closing stages. `[testing] closingStageDelay`, seconds.
  std::optional<std::chrono::milliseconds> closingStageDelay;
  /// For tests only: the wait between a client's end request and the end. `[testing] delayedEnd`, seconds.
  std::optional<std::chrono::milliseconds> delayedEnd;
};

}  // namespace zal
