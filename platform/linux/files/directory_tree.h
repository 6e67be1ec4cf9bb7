#pragma once

#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

#include "platform/linux/files/descriptor.h"

namespace zal {

// Trees by the handle of the directory that they lie in: whatever somebody puts in the way meanwhile, nothing
// outside is looked at or removed. Links are seen, never followed. Any thread; waits for a disk. Directories
// are gone into up to a hundred levels deep, each of which takes a descriptor.

/// Of st_blocks, on every file system.
inline constexpr std::uint64_t kBytesOfBlock = 512;

/// Not open when it is no directory: a link to one is none.
[[nodiscard]] Descriptor openDirectoryAt(int parent, const std::string& name);
/// Without "." and "..", in the order of bytes; as far as it could be read.
[[nodiscard]] std::vector<std::string> namesAt(int directory);
/// The same, with the error that ended it.
[[nodiscard]] std::vector<std::string> namesAt(int directory, std::error_code& error);
/// What the file, or the directory with all below it, takes of the disk. A file with several names counts
/// with its share of it for each.
[[nodiscard]] std::uint64_t diskBytesAt(int parent, const std::string& name);
/// Removes it with all below it. Returned: the first thing that could not be removed; the rest is gone then.
std::error_code removeTreeAt(int parent, const std::string& name);

}  // namespace zal
