#include "dump/action_dispatcher.h"

#include <chrono>
#include <utility>

#include "collectors/collectors.h"
#include "collectors/rotated_log_sets.h"
#include "dump/action_server.h"
#include "dump/collection_flags.h"
#include "dump/copied_logs_alert.h"
#include "dump/dump_reply.h"
#include "dump/log_compressor.h"
#include "dump/log_dump.h"
#include "dump/problem_prompt.h"
#include "dump/service_collection.h"
#include "dump/user_info.h"
#include "platform/platform.h"
#include "platform/standard_path.h"
#include "session/vistel_session.h"

namespace zal {
namespace {

// Bits of "displayFlags".
constexpr std::int32_t kPromptUser = 1;
constexpr std::int32_t kShowCompletion = 2;

struct Display {
  bool prompt;
  bool completionAlert;
};

/// A client that says nothing leaves it to the kind of install: the maker's own people are spared both.
Display displayFor(std::int32_t flags, bool internalInstall) {
  if (flags == 0) return {!internalInstall, !internalInstall};
  return {(flags & kPromptUser) != 0, (flags & kShowCompletion) != 0};
}

}  // namespace

void ActionDispatcher::performAction(const ActionRequest& request, ActionServer& server) {
  switch (request.action) {
    case 0:
      return _dumpBaseband(request);
    case 1:
      return _collectVideoCallLogs();
    case 2:
      return _dumpNetwork(server);
    case 3:
      return server.notePoorNetworkConditions();
    case 4:
      return _copyRegistrationLogs();
    case 7:
      return _collectMessagingLogs(request);
    case 8:
      return _automation.startVideoCalls(request.sender, server);
    case 9:
      return _automation.stopVideoCalls(request.sender, server);
    case 10:
      return _automation.startMessaging(request.sender, request.userInfo, server);
    case 11:
      return _automation.stopMessaging(request.sender, server);
    case kUserDumpAction:
      return _dumpLogsForUser(request, server);
    case 15:
      if (const auto useWifi = booleanOf(request.userInfo, "useWifi")) {
        server.startPing(request.session, *useWifi);
      }
      return;
    default:
      return;
  }
}

std::string ActionDispatcher::_reportRoot() const {
  const Platform& platform = _services.platform;
  return resolveAndStandardize(platform.configuration.roots.DiagnosticReportRoot,
                               platform.files.homeDirectory());
}

std::string ActionDispatcher::_makeSessionDirectory() {
  std::string directory = ZalLoggingAgentVistelSession::logPathForDate(
      _services.session, _services.platform.clock.wallNow(), _reportRoot() + "/Vistel", false);
  // One that cannot be made stays empty: the collectors pass over what they cannot write.
  _services.platform.files.makeDirectories(directory);
  return directory;
}

void ActionDispatcher::_dumpBaseband(const ActionRequest& request) {
  // Not here: the telephony service may take its time, and other clients wait.
  _services.platform.queues.global(QueuePriority::standard)
      .async([&cellular = _services.collectors.cellular,
              reason = textOf(request.userInfo, "reasonForSnapshot")] {
        cellular.DumpBasebandState(reason, "Vistel/Quillet");
      });
}

void ActionDispatcher::_collectVideoCallLogs() {
  const std::string directory = _makeSessionDirectory();
  const auto tellUser = [this](const std::optional<std::string>& archive) {
    if (archive) _services.platform.userAlerts.post(copiedLogsAlert("Vistel Logging", *archive), {});
  };
  _services.collection.CollectServiceLogs(
      {.service = "Vistel",
       .destination = directory,
       .reason = std::nullopt,
       .background = false,
       .flags = kUsualCollection},
      [this, directory, tellUser] {
        // The collection's archive is made already and stays: these go where the directory goes.
        const Platform& platform = _services.platform;
        LinkRecentLogSets(_services.collectors.files, platform.configuration.roots, platform.agentLog,
                          {"Vistel", "Nexa", "NexaIDQuery", "Transport"}, directory);
        CompressDirectory(_services.compressor, platform.agentLog, directory, std::nullopt, tellUser);
      });
}

void ActionDispatcher::_dumpNetwork(ActionServer& server) {
  const WallTime now = _services.platform.clock.wallNow();
  if (!_lastNetworkDump) _lastNetworkDump = now;
  if (std::chrono::abs(now - *_lastNetworkDump) > kNetworkDumpInterval) {
    _services.collectors.network.ForceNetworkDump(_makeSessionDirectory(), true);
    _lastNetworkDump = now;
  }
  server.notePoorNetworkConditions();
}

void ActionDispatcher::_copyRegistrationLogs() {
  const Platform& platform = _services.platform;
  LinkRecentLogSets(_services.collectors.files, platform.configuration.roots, platform.agentLog,
                    {"Registration"}, _reportRoot());
}

void ActionDispatcher::_collectMessagingLogs(const ActionRequest& request) {
  _services.collection.CollectServiceLogs({.service = "Quillet",
                                           .destination = _makeSessionDirectory(),
                                           .reason = textOf(request.userInfo, "reasonForSnapshot"),
                                           .background = false,
                                           .flags = kUsualCollection});
  _copyRegistrationLogs();
}

void ActionDispatcher::_dumpLogsForUser(const ActionRequest& request, ActionServer& server) {
  if (isEmptyText(request.session)) return;
  const Platform& platform = _services.platform;
  const ValueMap* const info = request.userInfo;
  const auto flags = static_cast<CollectionFlags>(integerOf(info, "collectionFlags"));
  const Display display = displayFor(integerOf(info, "displayFlags"), platform.configuration.internalInstall);
  const DumpRequest dump{
      .sessionType = std::string(*request.session),
      .dumpTimeText =
          ZalLoggingAgentVistelSession::logStringForDate(_services.session, platform.clock.wallNow()),
      .userInfo = info != nullptr ? *info : ValueMap{},
      .bugReportComponent = textOf(info, "borroComponent").value_or("Orvo Messages (New Bugs)"),
      .bugReportComponentVersion = textOf(info, "borroComponentVersion").value_or("1.0"),
      .replyToken = request.request != nullptr ? request.request->replyToken() : std::nullopt,
      .peer = request.peer,
      .collectionFlags = flags,
      .showCompletionAlert = display.completionAlert,
      .fileReport = (flags & kFileReport) != 0};
  if (!display.prompt) {
    _services.logDump.run(dump, dump.sessionType, server);
    return;
  }
  _services.platform.userAlerts.post(
      ProblemPrompt(textOf(info, "title").value_or(dump.sessionType + " Logging"),
                    "Please describe the problem briefly", "OK", "Cancel"),
      [this, dump, &server](const AlertResponse& response) {
        if (response.code == AlertResponse::kDefaultButton) {
          _services.logDump.run(dump, typedText(response), server);
        }
      });
}

}  // namespace zal
