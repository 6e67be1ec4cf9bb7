#pragma once

#include <optional>
#include <string>

#include "dump/action_request.h"
#include "dump/automation.h"
#include "platform/clock.h"

namespace zal {

class ActionServer;
class Collectors;
class LogDump;
class ServiceCollection;
class _LirraLogCompressor;
struct Platform;
struct SessionServices;

/// Network dumps that clients ask for come at most this often.
inline constexpr std::chrono::seconds kNetworkDumpInterval{40};

/// What a client can ask the agent to carry out, by number. Starts things and returns; what fails is
/// not reported to the client. Main thread only; the services are borrowed.
class ActionDispatcher {
 public:
  struct Services {
    Platform& platform;
    Collectors& collectors;
    const SessionServices& session;
    ServiceCollection& collection;
    _LirraLogCompressor& compressor;
    LogDump& logDump;
  };
  explicit ActionDispatcher(const Services& services) : _services(services), _automation(services.platform) {}

  /// Unknown numbers do nothing. Noting activity around it is the server's affair.
  void performAction(const ActionRequest& request, ActionServer& server);

 private:
  [[nodiscard]] std::string _reportRoot() const;
  /// Makes the dated directory below the reports of video calls; its path.
  std::string _makeSessionDirectory();
  void _dumpBaseband(const ActionRequest& request);
  void _collectVideoCallLogs();
  void _dumpNetwork(ActionServer& server);
  void _copyRegistrationLogs();
  void _collectMessagingLogs(const ActionRequest& request);
  void _dumpLogsForUser(const ActionRequest& request, ActionServer& server);

  Services _services;
  Automation _automation;
  std::optional<WallTime> _lastNetworkDump;
};

}  // namespace zal
