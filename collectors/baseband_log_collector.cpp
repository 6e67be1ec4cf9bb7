#include <filesystem>
#include <optional>

#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "collectors/log_walk.h"
#include "collectors/name_timestamp.h"
#include "platform/agent_log.h"
#include "platform/configuration.h"

namespace zal {
namespace {

constexpr std::size_t kTimestampPosition = 7;
constexpr std::size_t kShortestName = 27;

/// The stamp of the dump set to take: the last one later than the limit, else the last one before.
std::optional<WallTime> chosenSet(const std::vector<std::string>& names, WallTime limit, const Clock& clock) {
  std::optional<WallTime> before, after;
  for (const auto& name : names) {
    if (name.size() < kShortestName) continue;
    const auto stamp = timestampAt(name, kTimestampPosition, kDashedTimestamp, clock);
    if (stamp) (*stamp > limit ? after : before) = stamp;
  }
  return after ? after : before;
}

}  // namespace

void LogCollectors::CollectBasebandLogs(const std::string& dumpDirectory, WallTime startTime) {
  const DirectoryRoots& roots = _services.configuration.roots;
  const std::string source = roots.WirelessReportRoot + "/Baseband";
  const std::string destination = dumpDirectory + "/Baseband";
  walkLogs(_services.log, "baseband logs", [&] {
    const auto names = sortedNames(source, _services.placement);
    _services.files.makeDirectory(destination);
    _services.log.notice("Processing baseband logs");
    const auto chosen = chosenSet(names, dumpLimit(startTime), _services.clock);
    if (!chosen) return;
    // All files of one baseband dump carry one timestamp.
    const std::string stamp = timestampText(*chosen, kDashedTimestamp, _services.clock);
    for (const auto& name : names) {
      if (name.find(stamp) == std::string::npos) continue;
      const std::string path = source + "/" + name;
      if (_services.files.LinkFileIntoDirectory(path, destination, "")) continue;
      _services.log.warning(" ** FAILED Copied from " + path + " to " + destination);
    }
  });
  _services.files.LinkDirectoryEntriesWithPrefix(roots.WirelessLogRoot, "Telvane", dumpDirectory);
}

}  // namespace zal
