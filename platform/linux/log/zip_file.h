#pragma once

#include <string>
#include <system_error>

namespace zal {

/// Packs one file into a fresh zip archive, under `entryName` and with its time of modification, and
/// syncs the archive to the disk. Any thread; takes its time. Returned: why not; then the target is
/// gone. Both are relative to the open directory; a symbolic link is not followed as the source, and loses
/// its name as the target.
[[nodiscard]] std::error_code packIntoZip(int directory, const std::string& source, const std::string& target,
                                          const std::string& entryName);

}  // namespace zal
