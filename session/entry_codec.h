#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "session/session_entry.h"

namespace zal {

// An entry as a piece of a record; numbers are little-endian:
//
//     1    version, 1
//     1    kind
//     1    what is there: 1 text, 2 log, 4 sender, 8 time, 16 value
//     8    at, microseconds since 1970
//     8    time, a double
//     1+8  value: 0 signed, 1 unsigned, 2 double, 3 boolean; then its bits
//     4+n  text, log, sender: length and bytes
//
// What is not there takes no room, and nothing follows.

/// Replaces the buffer's content.
void encodeEntry(const SessionEntry& entry, std::string& buffer);
/// The texts are parts of the piece. Nothing for a piece that is no entry, or one of a later version.
[[nodiscard]] std::optional<SessionEntry> decodeEntry(std::string_view piece);

}  // namespace zal
