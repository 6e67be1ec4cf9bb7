#pragma once

#include <cstddef>
#include <string>
#include <system_error>

namespace zal {

struct CopyOptions {
  bool sync = false;  ///< everything copied is on the disk when the call returns, its own name aside
};

struct CopyOutcome {
  std::error_code error;    ///< the first one; what came after it was tried all the same
  std::size_t skipped = 0;  ///< pipes, sockets and devices below the source: left out, never opened
};

/// Copies a file, a symbolic link (as a link) or a directory with all below it, with permissions
/// (set-user-id and the like dropped) and modification times. Any thread; waits for disks. Nothing that
/// stands at the target is touched or followed, a dangling link neither: that is an error. A file that could
/// not be copied whole leaves nothing behind; a directory leaves what could be copied. A source that is no
/// file, link or directory is an error; a target inside the source does not contain itself.
[[nodiscard]] CopyOutcome copyTree(const std::string& source, const std::string& target, CopyOptions options);
/// The same with the target relative to an open directory.
[[nodiscard]] CopyOutcome copyTreeTo(int directory, const std::string& source, const std::string& target,
                                     CopyOptions options);

/// Brings a directory's own entries to the disk.
[[nodiscard]] std::error_code syncDirectory(const std::string& directory);
/// The handle may be one to look things up by.
[[nodiscard]] std::error_code syncDirectoryAt(int directory);

}  // namespace zal
