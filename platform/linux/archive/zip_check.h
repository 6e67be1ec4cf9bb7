#pragma once

#include <cstdint>
#include <string>

namespace zal {

/// Reads the archive back, through its directory: every entry is unpacked, and its length and checksum
/// compared with what the directory says. On threads of its own; waits for disks. Returned: what is
/// wrong, empty when the archive is whole and has that many entries.
[[nodiscard]] std::string checkZipArchive(const std::string& archive, std::uint64_t entries);

}  // namespace zal
