#pragma once

#include <cstddef>
#include <cstdint>

namespace zal {

/// The bytes are an archive, which is verified. Ends the process when a promise is broken.
void fuzzArchive(const std::uint8_t* data, std::size_t size);

}  // namespace zal
