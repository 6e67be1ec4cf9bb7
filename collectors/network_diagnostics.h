#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

namespace zal {

class AgentLog;
class CellularSnapshot;
class CommandRunner;
class CommandTable;
class DeviceSupport;
class FileCollector;
class PreferenceStore;
class SystemShell;
class WorkQueue;
class WorkQueues;
enum class CommandGroup;
class _ZalLoggingAgentPingRunner;
struct Configuration;

/// Bits of a session's begin flags that ask for captures.
inline constexpr std::uint64_t kBeginFlagPingCaptures = 1;
inline constexpr std::uint64_t kBeginFlagSystemLogCaptures = 2;

/// Gathers what there is to know about the device's networking: captures while a session runs, and
/// a dump of everything on request. Nothing here reports failure; the log names a directory that
/// could not be made. Its services are borrowed; they and this object outlive every job it queues.
class NetworkDiagnostics {
 public:
  struct Services {
    const Configuration& configuration;
    AgentLog& log;
    WorkQueues& queues;
    PreferenceStore& preferences;
    DeviceSupport& deviceSupport;
    SystemShell& shell;
    CommandRunner& commands;
    const CommandTable& table;
    FileCollector& files;
    CellularSnapshot& cellular;
    _ZalLoggingAgentPingRunner& pings;
  };
  explicit NetworkDiagnostics(const Services& services);
  ~NetworkDiagnostics();

  // To kill the log readers a shell has to be waited for: where it does not say otherwise that is left to one
  // serial queue, so that captures stop and start in the order in which this was called.

  /// Stops what captures there are, then starts those that the flags (or the preference "pingtest")
  /// ask for, into fixed files of the temporary root. Main thread only.
  void StartSessionCaptures(std::uint64_t flags);
  /// Stops long ping tests and kills every live log reader; waits for the latter. Any thread.
  void StopCaptures();
  /// The same without waiting; `then` is called once they are gone, on any thread.
  void stopCapturesThen(std::function<void()> then);
  /// Continuous pings of the two servers into these files. Main thread only.
  void StartServerPings(const std::string& wifiOutputPath, const std::string& cellularOutputPath);
  /// Stops the captures, then queues the collection at background priority. Main thread only;
  /// returns without waiting for the dump.
  void ForceNetworkDump(const std::string& directory, bool includePing);
  /// The same where the captures were stopped; any thread.
  void queueNetworkDump(const std::string& directory, bool withPings);
  /// Whether a dump has pings: asked for, or preferred by "pingtest". Main thread only.
  [[nodiscard]] bool wantsPings(bool includePing) { return includePing || _isPingTestPreferred(); }
  /// The dump itself: fills CT, WiFi, Other, Statistics and Console below the directory, which are
  /// made as needed, and moves the captures there. Any thread, but made for the background queue: it
  /// takes its time. Commands and pings that it starts outlive it.
  void CollectNetworkLogs(const std::string& directory, bool includePing);
  /// The part of it that takes the Wi-Fi driver's files, into a directory that exists. Any thread.
  void CollectWiFiFiles(const std::string& directory);

  /// Any thread; false where there is no such service.
  [[nodiscard]] bool VideoCallsOverCellularAvailable();

 private:
  [[nodiscard]] bool _isPingTestPreferred();
  void _runCommands(CommandGroup group, const std::string& directory);
  void _moveCaptures(const std::string& statistics, const std::string& console, bool includePing);
  void _startDumpPings(const std::string& statistics, bool includePing);

  Services _services;
  const std::unique_ptr<WorkQueue> _captures;
};

}  // namespace zal
