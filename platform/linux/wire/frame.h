#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace zal {

/// What a frame is for. Numbers are the wire's.
enum class FrameKind : std::uint16_t {
  message = 0,
  messageExpectingReply = 1,
  reply = 2,
  barrier = 3,
  barrierPassed = 4,
};

/// Header of every frame, 16 bytes, little-endian:
///
///     0        4         6      8                16
///     | length | version | kind |     cookie     | payload … | zeros up to a multiple of 8 |
///
/// `length` counts the payload only. The cookie is the client's choice for kinds 1 and 3, is
/// repeated in the answer, and is 0 otherwise.
struct FrameHeader {
  std::uint32_t length = 0;
  std::uint16_t version = 1;
  FrameKind kind = FrameKind::message;
  std::uint64_t cookie = 0;
};

inline constexpr std::size_t kFrameHeaderSize = 16;
inline constexpr std::uint16_t kProtocolVersion = 1;
inline constexpr std::uint32_t kDefaultMaximumPayload = 16U << 20U;

/// Bytes of a whole frame with that payload, padding included.
[[nodiscard]] constexpr std::size_t frameSize(std::size_t payload) {
  return kFrameHeaderSize + ((payload + 7U) & ~std::size_t{7});
}

/// Writes the 16 bytes as they are, `length` included.
void storeFrameHeader(char* to, const FrameHeader& header);

/// Appends header, payload and padding. `length` is set from the payload.
void appendFrame(std::string& out, const FrameHeader& header, std::string_view payload);

}  // namespace zal
