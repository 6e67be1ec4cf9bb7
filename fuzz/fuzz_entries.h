#pragma once

#include <cstddef>
#include <cstdint>

namespace zal {

/// Each takes any bytes and ends the process when a promise is broken. The fuzzers call them without
/// end, the tests once for each file of the corpora.
///
/// The first byte says how many of the next ones are sizes of chunks; the rest is a byte stream that
/// is cut so. The frames must be those of the uncut stream.
void fuzzFrames(const std::uint8_t* data, std::size_t size);
/// The bytes are the payload of a message, of which everything is read.
void fuzzMessage(const std::uint8_t* data, std::size_t size);
/// The first byte is a file's seed, and the rest the file; after a 0 the rest is one piece.
void fuzzBlackBox(const std::uint8_t* data, std::size_t size);

}  // namespace zal
