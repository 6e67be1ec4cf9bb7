#include <algorithm>
#include <array>
#include <filesystem>

#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "collectors/log_walk.h"
#include "platform/configuration.h"
#include "platform/file_placement.h"
#include "platform/standard_path.h"

namespace zal {
namespace {

constexpr std::array<std::string_view, 3> kCrashingProcesses = {"Orrisd", "Vistel", "Dialette"};
constexpr std::string_view kNetworkStackPrefix = "Webstrand";

bool isCrashReportName(const std::string& name) {
  return std::any_of(kCrashingProcesses.begin(), kCrashingProcesses.end(),
                     [&](std::string_view process) { return name.starts_with(process); });
}

bool isThereAndNoDirectory(const std::string& path, FilePlacement& placement) {
  std::error_code error;
  const auto status = std::filesystem::status(resolveAndStandardize(path, placement.homeDirectory()), error);
  return std::filesystem::exists(status) && !std::filesystem::is_directory(status);
}

}  // namespace

void LogCollectors::CollectCrashLogs(const std::string& destination) {
  const std::string directory = _services.configuration.roots.DiagnosticReportRoot + "/";
  walkLogs(_services.log, "crash logs", [&] {
    for (const auto& name : sortedNames(directory, _services.placement)) {
      if (!isCrashReportName(name) || !isThereAndNoDirectory(directory + name, _services.placement)) continue;
      _services.files.LinkFileIntoDirectory(directory + name, destination, "");
    }
  });
}

void LogCollectors::CollectNetworkStackLogs(const std::string& destination) {
  const DirectoryRoots& roots = _services.configuration.roots;
  for (const std::string& root :
       {roots.SystemReportRoot, roots.WirelessReportRoot, roots.RootReportRoot, roots.DiagnosticReportRoot}) {
    const std::string directory = root + "/";
    walkLogs(_services.log, "webstrand logs", [&] {
      for (const auto& name : sortedNames(directory, _services.placement)) {
        if (!name.starts_with(kNetworkStackPrefix)) continue;
        _services.files.LinkFileIntoDirectory(directory + name, destination, "");
      }
    });
  }
}

}  // namespace zal
