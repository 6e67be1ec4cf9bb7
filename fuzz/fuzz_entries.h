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

/// The first byte says how the rest is read: 0, a whole lirra.toml; else a preference file, in which one of
/// its switches is set.
void fuzzConfiguration(const std::uint8_t* data, std::size_t size);
/// The bytes are a property list, whose texts are written and read again.
void fuzzPropertyList(const std::uint8_t* data, std::size_t size);
/// The bytes are a file's name, in which a timestamp is looked for at every place and in every form.
void fuzzName(const std::uint8_t* data, std::size_t size);
/// The first byte says what gave the rest: 0, an alert's file; 1, an answer's; else a dialog's program, which
/// ended with that status.
void fuzzAlert(const std::uint8_t* data, std::size_t size);

}  // namespace zal
