#include "platform/linux/disk/kept_places.h"

#include "platform/linux/progress/progress_file.h"

namespace zal {

std::string temporaryArea(const DirectoryRoots& roots, uid_t user) {
  return roots.DiagnosticReportRoot + "/.com.vendel.lirra-" + std::to_string(user);
}

std::string blackBoxDirectory(const DirectoryRoots& roots) { return roots.StateRoot + "/BlackBox"; }

FileKeptStore::Places keptPlaces(const DirectoryRoots& roots, uid_t user) {
  return {.reports = roots.DiagnosticReportRoot,
          .userLogs = roots.UserLogRoot,
          .blackBox = blackBoxDirectory(roots),
          .progress = progressDirectory(roots.RuntimeRoot),
          .temporaryArea = temporaryArea(roots, user)};
}

}  // namespace zal
