#pragma once

#include <cstdint>
#include <functional>
#include <string>

#include "platform/configuration.h"
#include "platform/file_copier.h"
#include "platform/linux/files/rooted_paths.h"

namespace zal {

/// How writing an archive ended.
struct ArchiveOutcome {
  std::string failure;  ///< empty: it is there, synced
  bool outputIsOurs = false;
  std::uint64_t entries = 0;
  bool hasMissed = false;  ///< something could not be read that perhaps can be, another time
};

/// Writes the directory into a new zip archive at `output` and syncs it. `line` gets a line for
/// everything that is left out or cut, on the calling thread, and so does the ending's text, if there is
/// one. The paths say how the directory is reached. Waits for disks; compresses on threads of its own.
[[nodiscard]] ArchiveOutcome writeZipArchive(const std::string& directory, const std::string& output,
                                             ArchiveCompression compression, const ArchiveEnding& ending,
                                             const std::function<void(const std::string&)>& line,
                                             const RootedPaths& paths = {});

}  // namespace zal
