#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/archive_inspection.h"

namespace zal {

/// What an archive is worth: what is there, what is not and why, what is damaged. Texts of the manifest are
/// any text.
struct ArchiveVerdict {
  struct Finding {
    std::string what;
    std::string why;
  };
  std::size_t files = 0;    ///< regular files that are whole, the manifest aside
  std::uint64_t bytes = 0;  ///< in them
  bool hasManifest = false;
  std::string service, flags, began, archived;  ///< as the manifest has them
  std::vector<Finding> missing;                 ///< what was wanted and is not there, or not all of it
  std::vector<std::string> skipped;             ///< steps that nobody asked for
  std::vector<Finding> damaged;
};

/// Holds the archive against the manifest in it; without one only its checksums count. Pure; any archive.
[[nodiscard]] ArchiveVerdict judgeArchive(const ArchiveInspection& archive);

}  // namespace zal
