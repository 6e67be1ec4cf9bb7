#pragma once

#include <string>

namespace zal {

/// The host directories that all of the agent's paths start from. Absolute, or beginning with "~";
/// no trailing slash. Every field is a key of `[roots]` in the configuration.
struct DirectoryRoots {
  std::string UserLogRoot;           ///< logs of the user the agent runs as
  std::string MobileLogRoot;         ///< logs of the device's ordinary user
  std::string DiagnosticReportRoot;  ///< crash reports of that user; sessions and dumps live below
  std::string WirelessLogRoot;       ///< logs of the telephony user
  std::string WirelessReportRoot;    ///< crash reports of the telephony user
  std::string RootReportRoot;        ///< crash reports of the superuser
  std::string SystemLogRoot;         ///< system-wide logs
  std::string SystemReportRoot;      ///< system-wide crash reports
  std::string NetworkConfigRoot;     ///< the system's network-configuration preferences
  std::string MediaLogCacheDir;      ///< the media daemon's cache of video-conference logs
  std::string LocationCacheDir;      ///< the location daemon's cache
  std::string TemporaryRoot = "/tmp";
  std::string UartLogFile = "/dev/uart.log";
  std::string VarLogRoot = "/var/log";
  std::string RuntimeRoot;  ///< notifications, alerts, progress records; gone after a restart of the host
  std::string StateRoot;    ///< what the agent keeps for its own next start
};

}  // namespace zal
