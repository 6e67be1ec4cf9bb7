#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace zal {

/// A little-endian unsigned number of 1, 2, 4 or 8 bytes, wherever it lies.
[[nodiscard]] inline std::uint64_t loadLittle(const char* from, std::size_t width) {
  if constexpr (std::endian::native == std::endian::little) {
    // Constant sizes become single loads.
    switch (width) {
      case 1:
        return static_cast<unsigned char>(*from);
      case 2: {
        std::uint16_t value = 0;
        std::memcpy(&value, from, sizeof value);
        return value;
      }
      case 4: {
        std::uint32_t value = 0;
        std::memcpy(&value, from, sizeof value);
        return value;
      }
      default: {
        std::uint64_t value = 0;
        std::memcpy(&value, from, sizeof value);
        return value;
      }
    }
  }
  std::uint64_t value = 0;
  for (std::size_t i = 0; i < width; ++i) {
    value |= std::uint64_t{static_cast<unsigned char>(from[i])} << (8 * i);
  }
  return value;
}

/// The lowest `width` bytes (1 to 8) of the value, little-endian.
inline void storeLittle(char* to, std::uint64_t value, std::size_t width) {
  if constexpr (std::endian::native == std::endian::little) {
    std::memcpy(to, &value, width);
  } else {
    for (std::size_t i = 0; i < width; ++i) to[i] = static_cast<char>(value >> (8 * i));
  }
}

}  // namespace zal
