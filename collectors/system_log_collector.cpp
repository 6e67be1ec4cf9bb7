#include "collectors/command_table.h"
#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "collectors/log_walk.h"
#include "collectors/name_timestamp.h"
#include "platform/agent_log.h"
#include "platform/configuration.h"

namespace zal {
namespace {

constexpr std::string_view kSystemLogPrefix = "SystemLog";
constexpr std::size_t kSystemLogTimestampPosition = 10;

// The doubled entry is as old as the list and changes nothing.
const std::vector<std::string>& crashReportFragments() {
  static const std::vector<std::string> fragments = {
      "Messages", "zalavagent", "zalagent",     "ZalTrans",  "ZalLogging", "nexad",    "Vistel",
      "beacond",  "ZalService", "ZalRemoteURL", "Textelle",  "Orrisd",     "Dialette", "ledgerlyd",
      "vaultq",   "Shellface",  "ZalDPersist",  "ledgerlyd", "Corvell",    "Plinth",   "Cardlet"};
  return fragments;
}

}  // namespace

void LogCollectors::CollectSystemLogs(const std::string& destination, WallTime startTime) {
  const std::string& source = _services.configuration.roots.WirelessReportRoot;
  const WallTime limit = dumpLimit(startTime);
  _services.log.notice("Processing system logs in path: " + destination);
  walkLogs(_services.log, "system logs", [&] {
    for (const auto& name : sortedNames(source, _services.placement)) {
      if (!name.starts_with(kSystemLogPrefix)) continue;
      const auto stamp = timestampAt(name, kSystemLogTimestampPosition, kCompactTimestamp, _services.clock);
      if (stamp && *stamp > limit) {
        _services.files.LinkFileIntoDirectory(source + "/" + name, destination, "");
      }
    }
  });
  _services.files.CopyCrashReportsMatching(crashReportFragments(), destination);
  // "screenshot.png" is the name of a picture of the screen, once there is one to be had.
  _services.table.runInBackground(_services.commands, CommandGroup::systemLogs, destination);
  _services.log.notice(" => Done");
}

}  // namespace zal
