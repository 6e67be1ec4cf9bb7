#include "platform/linux/wire/frame.h"

#include <bit>

namespace zal {
namespace {

template <class Unsigned>
void storeLittle(char* to, Unsigned value) {
  if constexpr (std::endian::native == std::endian::little) {
    std::memcpy(to, &value, sizeof value);
  } else {
    for (std::size_t i = 0; i < sizeof value; ++i) to[i] = static_cast<char>(value >> (8 * i));
  }
}

}  // namespace

void storeFrameHeader(char* to, const FrameHeader& header) {
  storeLittle(to, header.length);
  storeLittle(to + 4, header.version);
  storeLittle(to + 6, static_cast<std::uint16_t>(header.kind));
  storeLittle(to + 8, header.cookie);
}

void appendFrame(std::string& out, const FrameHeader& header, std::string_view payload) {
  const std::size_t start = out.size();
  out.resize(start + frameSize(payload.size()));  // the padding's zeros come with it
  FrameHeader counted = header;
  counted.length = static_cast<std::uint32_t>(payload.size());
  storeFrameHeader(out.data() + start, counted);
  if (!payload.empty()) std::memcpy(out.data() + start + kFrameHeaderSize, payload.data(), payload.size());
}

}  // namespace zal
