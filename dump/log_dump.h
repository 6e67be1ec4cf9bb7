#pragma once

#include <optional>
#include <string>
#include <vector>

#include "dump/dump_request.h"

namespace zal {

class ActionServer;
class ServiceCollection;
class _LirraLogCompressor;
class Collectors;
struct Platform;
struct SessionServices;

/// A dump for a user, from its description to the reply: names and fills the dump directory, has it
/// archived, tells the user, the system and the client. Main thread only; the services are borrowed.
class LogDump {
 public:
  struct Services {
    Platform& platform;
    Collectors& collectors;
    const SessionServices& session;
    ServiceCollection& collection;
    _LirraLogCompressor& compressor;
  };
  explicit LogDump(const Services& services) : _services(services) {}

  /// Returns once the collection was started. The server is borrowed beyond that: it outlives every
  /// dump. A directory that would lie outside the report root is refused with one warning, and
  /// then there is no archive and no path in a reply.
  void run(const DumpRequest& request, const std::optional<std::string>& description, ActionServer& server);

 private:
  Services _services;
};

/// Where a dump of this type, time and description goes, standardised; nothing when that would not
/// lie below the report root.
[[nodiscard]] std::optional<std::string> dumpDirectoryPath(const std::string& reportRoot,
                                                           const std::string& home,
                                                           const DumpRequest& request,
                                                           const std::optional<std::string>& description);
/// The log sets that belong to a session type, in the order they are taken.
[[nodiscard]] std::vector<std::string> dumpLogSets(const std::string& sessionType);
/// Where a bug-report system would be called. It does nothing and returns 0.
int FileReportHook(const std::optional<std::string>& description, const std::string& component,
                   const std::string& componentVersion, const std::vector<std::string>& archives);

}  // namespace zal
