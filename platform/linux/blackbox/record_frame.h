#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "platform/session_records.h"

namespace zal {

// One piece of a record as it lies in the file; numbers are little-endian, checksums CRC-32C:
//
//     0   4   5A 52 B1 01, the last byte is the layout's version
//     4   4   length of the piece
//     8   4   checksum of the bytes above, begun with the file's seed
//    12   4   checksum of the piece, begun with the checksum above
//    16       the piece
//
// The seed is the file's own, so that neither a client's text nor another file's remains can pass for a
// piece. With a checksum of its own the length can be trusted when the piece is damaged, and a search for
// the next piece looks at each byte once.

inline constexpr std::size_t kRecordFrameHeaderSize = 16;

void appendRecordFrame(std::string& bytes, std::uint32_t seed, std::string_view piece);

/// Every whole piece of a file, in order. Bytes that are none are passed over and counted, but for zeros at
/// the end. Never fails; time is linear in the bytes.
[[nodiscard]] UnfinishedRecord readRecordFrames(std::string_view bytes, std::uint32_t seed);

}  // namespace zal
