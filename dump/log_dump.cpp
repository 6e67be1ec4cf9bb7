#include "dump/log_dump.h"

#include "collectors/collectors.h"
#include "collectors/rotated_log_sets.h"
#include "dump/action_server.h"
#include "dump/copied_logs_alert.h"
#include "dump/dump_directory.h"
#include "dump/dump_log_sets.h"
#include "dump/dump_reply.h"
#include "dump/dump_texts.h"
#include "dump/log_compressor.h"
#include "dump/service_collection.h"
#include "dump/user_info.h"
#include "platform/platform.h"
#include "session/collected_files.h"
#include "session/device_model.h"
#include "session/text_encoding.h"

namespace zal {
namespace {

constexpr std::string_view kDumpComplete = "LirraLoggingDumpComplete";
/// Of a refused type, as much as a log line can bear.
constexpr std::size_t kTypeInWarning = 100;

bool saysSomething(const std::optional<std::string>& text) { return text && !trimmed(*text).empty(); }

}  // namespace

void LogDump::run(const DumpRequest& request, const std::optional<std::string>& description,
                  ActionServer& server) {
  const Platform& platform = _services.platform;
  const DirectoryRoots& roots = platform.configuration.roots;
  const std::optional<std::string> reason = saysSomething(description) ? description : std::nullopt;
  const auto directory =
      dumpDirectoryPath(roots.DiagnosticReportRoot, platform.files.homeDirectory(), request, reason);
  if (!directory) {
    platform.agentLog.warning(
        "Refused a dump of \"" + printable(utf16Prefix(request.sessionType, kTypeInWarning)) +
        "\": its directory would not lie below the report root, or only through a link");
    _complete(request, reason, std::nullopt, server);
    return;
  }

  LinkRecentLogSets(_services.collectors.files, roots, platform.agentLog, dumpLogSets(request.sessionType),
                    *directory);
  const auto complete = [this, request, reason, &server](const std::optional<std::string>& archive) {
    _complete(request, reason, archive, server);
  };
  // The collection makes the archive; asking once more only gives its path.
  _services.collection.CollectServiceLogs({.service = request.sessionType,
                                           .destination = *directory,
                                           .reason = reason,
                                           .background = false,
                                           .flags = request.collectionFlags},
                                          [this, directory, complete] {
                                            CompressDirectory(_services.compressor,
                                                              _services.platform.agentLog, directory,
                                                              std::nullopt, complete);
                                          });
  if (reason) writeWholeFile(platform.files, platform.agentLog, *directory + "/Reason.txt", *reason);
  writeWholeFile(platform.files, platform.agentLog, *directory + "/Device_Info.txt", _deviceInfo());
}

std::string LogDump::_deviceInfo() {
  return deviceInfoText(_services.platform.deviceSupport.deviceName(),
                        deviceModel(_services.session.deviceRegistry).value_or(""));
}

void LogDump::_complete(const DumpRequest& request, const std::optional<std::string>& reason,
                        const std::optional<std::string>& archive, ActionServer& server) {
  if (archive) {
    if (request.showCompletionAlert) _alert(request, *archive, server);
    if (request.fileReport) {
      _fileReport(reason, request.bugReportComponent, request.bugReportComponentVersion, {*archive});
    }
  }
  sendDumpReply(request, archive);
}

void LogDump::_alert(const DumpRequest& request, const std::string& archive, ActionServer& server) {
  UserAlert alert =
      copiedLogsAlert(textOf(&request.userInfo, "title").value_or(request.sessionType + " Logging"), archive);
  alert.information = {{"Path", archive}};
  _services.platform.userAlerts.post(std::move(alert),
                                     [&server](const AlertResponse&) { server.userNotificationDidFinish(); });
  _services.platform.systemNotifications.post(kDumpComplete);
}

}  // namespace zal
