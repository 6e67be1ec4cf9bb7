#pragma once

#include <sys/types.h>

#include <string>

#include "platform/directory_roots.h"
#include "platform/linux/disk/file_kept_store.h"

namespace zal {

/// Where archives lie that are still being made. For one user alone; the number keeps users of one machine
/// apart. On the file system that archives go to in the end: moving one there then needs no room that a full
/// disk would not have.
[[nodiscard]] std::string temporaryArea(const DirectoryRoots& roots, uid_t user);
/// Where the black box keeps its records.
[[nodiscard]] std::string blackBoxDirectory(const DirectoryRoots& roots);
/// All that an agent of this user keeps.
[[nodiscard]] FileKeptStore::Places keptPlaces(const DirectoryRoots& roots, uid_t user);

}  // namespace zal
