#pragma once

#include <string>
#include <system_error>

#include "platform/linux/files/descriptor.h"

namespace zal {

// Directories below one that is open, reached through directories alone: a symbolic link on the way or at the
// end is an error (too_many_symbolic_link_levels), and so is a path with ".." or one that begins with a slash
// (EXDEV), wherever it would lead. Any thread; waits for a disk.

/// How the way is gone: in one call, where the kernel has it and a filter of system calls lets it through, or
/// a directory at a time. The answers are the same.
enum class WayDown { inOneCall, inSteps };

/// A handle to look things up by, not to list or to sync. An empty path is the directory itself. Not open:
/// errno says why.
[[nodiscard]] Descriptor openDirectoryBeneath(int directory, const std::string& path,
                                              WayDown way = WayDown::inOneCall);

/// Makes it with all that is missing on the way. What was made has mode 0777 whatever the umask says, for
/// several users' daemons write there; what was there keeps its own. Returned: no error when it is there at
/// the end.
std::error_code makeDirectoriesBeneath(int directory, const std::string& path);

}  // namespace zal
