#include "platform/linux/wire/frame.h"

#include "platform/linux/wire/little_endian.h"

namespace zal {

void storeFrameHeader(char* to, const FrameHeader& header) {
  storeLittle(to, header.length, 4);
  storeLittle(to + 4, header.version, 2);
  storeLittle(to + 6, static_cast<std::uint16_t>(header.kind), 2);
  storeLittle(to + 8, header.cookie, 8);
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
