#include "platform/linux/client_channel/frame_batch.h"

#include <limits>
#include <utility>

#include "platform/linux/wire/frame_decoder.h"

namespace zal {
namespace {

constexpr std::size_t kKeptCapacity = 512U << 10U;

}  // namespace

void FrameBatch::append(std::string_view frame, bool isRequest) {
  _bytes.append(frame);
  ++_count.frames;
  if (isRequest) ++_count.requests;
}

void FrameBatch::clear() {
  _bytes.clear();
  _written = 0;
  _count = {};
}

void FrameBatch::trim() {
  if (_bytes.capacity() > kKeptCapacity) _bytes = std::string();
}

void FrameBatch::swap(FrameBatch& other) {
  std::swap(_bytes, other._bytes);
  std::swap(_written, other._written);
  std::swap(_count, other._count);
}

FrameBatch::Count FrameBatch::forgetWritten() {
  Count count;
  std::size_t position = 0;
  FrameDecoder decoder(std::numeric_limits<std::uint32_t>::max());
  decoder.feed(std::string_view(_bytes).substr(0, _written));
  while (const auto frame = decoder.next()) {
    position += frameSize(frame->payload.size());
    ++count.frames;
    if (frame->header.kind != FrameKind::barrier) ++count.requests;
  }
  _bytes.erase(0, position);
  _written = 0;
  _count.frames -= count.frames;
  _count.requests -= count.requests;
  return count;
}

}  // namespace zal
