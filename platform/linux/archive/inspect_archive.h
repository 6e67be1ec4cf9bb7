#pragma once

#include "platform/archive_inspection.h"

namespace zal {

/// Reads all of an archive that this agent may have made: every checksum, every hash. Writes nothing
/// anywhere. Whatever the file holds, reading it costs no more memory than a few times its directory and
/// no more time than unpacking it once: entries that share bytes are not unpacked. The file stays the
/// caller's. Any thread. Throws std::bad_alloc.
[[nodiscard]] ArchiveInspection inspectArchive(int file);

}  // namespace zal
