#pragma once

#include <chrono>
#include <cstdint>
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

/// `[log]`
struct LogSettings {
  std::vector<std::string> categories;       ///< switched on; LIRRA_LOG_CATEGORIES adds to them
  std::uint64_t rotationSize = 4ULL << 20U;  ///< bytes after which a log file is rotated
  std::uint32_t maximumOpenFiles = 64;
};

/// Everything a deployment can set; the defaults are the product's. Read once at start.
struct Configuration {
  DirectoryRoots roots;
  Endpoints endpoints;
  Interfaces interfaces;
  IpcSettings ipc;
  LogSettings log;
  std::string systemVersionFile;  ///< property list; empty: os-release and the kernel answer
  /// For tests only: the agent's six minutes of idling shortened. `[testing] inactivityLimit`, seconds.
  std::optional<std::chrono::milliseconds> inactivityLimit;
};

}  // namespace zal
