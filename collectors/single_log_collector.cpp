#include "collectors/file_collector.h"
#include "collectors/log_collectors.h"
#include "platform/configuration.h"

namespace zal {

void LogCollectors::LinkThermalLog(const std::string& destination) {
  _services.files.LinkFileIntoDirectory(
      _services.configuration.roots.TemporaryRoot + "/vistel_thermal_log.txt", destination, "");
}

void LogCollectors::CopyDiagnosticAndSyncLogs(const std::string& destination) {
  const DirectoryRoots& roots = _services.configuration.roots;
  for (const std::string& source :
       {roots.MobileLogRoot + "/Cirrel", roots.DiagnosticReportRoot + "/DiagnosticLogs"}) {
    _services.files.makeDirectory(destination);
    _services.files.CopyDirectoryContents(source, destination);
  }
}

}  // namespace zal
