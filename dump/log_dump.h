#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>

#include "dump/dump_request.h"
#include "dump/report_hook.h"

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
  using ReportHook = std::function<decltype(FileReportHook)>;
  explicit LogDump(const Services& services, ReportHook fileReport = FileReportHook)
      : _services(services), _fileReport(std::move(fileReport)) {}

  /// Returns once the collection was started. The server is borrowed beyond that: it outlives every
  /// dump. A directory that would lie outside the report root is refused with one warning; then
  /// nothing is gathered, and only the client hears of it: by a reply without a path.
  void run(const DumpRequest& request, const std::optional<std::string>& description, ActionServer& server);

 private:
  /// The dump is over; without an archive when it was refused.
  void _complete(const DumpRequest& request, const std::optional<std::string>& reason,
                 const std::optional<std::string>& archive, ActionServer& server);
  void _alert(const DumpRequest& request, const std::string& archive, ActionServer& server);
  [[nodiscard]] std::string _deviceInfo();

  Services _services;
  ReportHook _fileReport;
};

}  // namespace zal
