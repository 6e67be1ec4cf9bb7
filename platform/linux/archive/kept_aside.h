#pragma once

#include <string>
#include <system_error>

#include "platform/linux/files/rooted_paths.h"

namespace zal {

/// Gives a directory (or whatever stands there) a name of its own beside it, so that who deletes the
/// path deletes nothing: its name with " (not archived)" appended, then with "-2" …, cut where the file
/// system wants it shorter. Returned: the new path; empty with an error when it could not be done.
[[nodiscard]] std::string keepAside(const std::string& path, std::error_code& error,
                                    const RootedPaths& paths = {});

}  // namespace zal
