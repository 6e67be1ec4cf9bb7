#include "agent/session_directory.h"

#include "agent/home_relative_path.h"

namespace zal {

std::string sessionDirectory(const Platform& platform, const std::string& sessionTypeKey) {
  return homeRelativePath(platform.configuration.roots.DiagnosticReportRoot, platform.files.homeDirectory()) +
         "/" + sessionTypeKey;
}

}  // namespace zal
