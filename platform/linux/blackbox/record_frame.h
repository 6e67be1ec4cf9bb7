#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace zal {

class RecordWindow;

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

/// Gives every whole piece of a file to the handler, in order and borrowed for the call. Returned: the bytes
/// that are none, which are passed over; zeros at the end are not counted. Never fails; time is linear in
/// the bytes, memory is that of the window, which widens for a piece that is longer.
std::uint64_t readRecordFrames(RecordWindow& file, std::uint32_t seed,
                               const std::function<void(std::string_view piece)>& handler);

}  // namespace zal
