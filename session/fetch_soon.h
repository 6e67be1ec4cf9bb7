#pragma once

#include <cstddef>
#include <cstdint>

namespace zal {

/// Tells the processor that this memory is wanted shortly. Lines that arrived in no order lie all over
/// the memory, and waiting for each in its turn is what handing them out in order would cost.
inline void fetchSoon(const void* address, std::size_t offset = 0) {
  // As a number: the offset may lead past the end of what is there, and fetching does not mind.
  __builtin_prefetch(reinterpret_cast<const void*>(reinterpret_cast<std::uintptr_t>(address) + offset));
}

}  // namespace zal
