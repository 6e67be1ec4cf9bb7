#include <array>

#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "collectors/log_walk.h"
#include "collectors/name_timestamp.h"
#include "platform/configuration.h"

namespace zal {
namespace {

/// The last entry is one name, long as it is. It matches nothing that daemons write today, and the
/// snapshots of those whose names are in it stay out.
constexpr std::array<std::string_view, 6> kSnapshotPrefixes = {
    "zalagent",   "nexad",
    "zalavagent", "Orrisd",
    "Homeframe",  "DialetteledgerlydplumedZalDPersistenceZalRemotestackZalTransferZalTranscodVistel",
};

}  // namespace

void LogCollectors::CollectSnapshotLogs(const std::string& destination, WallTime startTime) {
  const std::string& source = _services.configuration.roots.DiagnosticReportRoot;
  const WallTime limit = dumpLimit(startTime);
  std::array<bool, kSnapshotPrefixes.size()> done{};
  walkLogs(_services.log, "snapshot logs", [&] {
    for (const auto& name : sortedNames(source, _services.placement)) {
      for (std::size_t i = 0; i < kSnapshotPrefixes.size(); ++i) {
        if (done[i] || !name.starts_with(kSnapshotPrefixes[i])) continue;
        const std::size_t position = kSnapshotPrefixes[i].size() + 1;  // one separator
        const auto stamp = timestampAt(name, position, kCompactTimestamp, _services.clock);
        if (!stamp || *stamp <= limit) continue;
        _services.files.LinkFileIntoDirectory(source + "/" + name, destination, "");
        done[i] = true;
      }
    }
  });
}

}  // namespace zal
