#include "platform/linux/archive/deflate_continuation.h"

#include <zlib.h>

#include <array>
#include <new>

namespace zal {
namespace {

// As zlib tells when it stops, beside the number of bits not used of the last byte taken.
constexpr int kBetweenBlocks = 128;
constexpr int kLastBlock = 64;
constexpr int kUnusedBits = 7;

}  // namespace

struct DeflateContinuation::Decoder {
  z_stream stream{};
  std::array<unsigned char, 64U << 10U> output;
};

DeflateContinuation::DeflateContinuation() : _decoder(std::make_unique<Decoder>()) {
  if (::inflateInit2(&_decoder->stream, -MAX_WBITS) != Z_OK) throw std::bad_alloc();
}

DeflateContinuation::~DeflateContinuation() { ::inflateEnd(&_decoder->stream); }

std::size_t DeflateContinuation::letAnotherFollow(char* bytes, std::size_t size, std::size_t content) {
  z_stream& stream = _decoder->stream;
  if (::inflateReset(&stream) != Z_OK) return 0;
  stream.next_in = reinterpret_cast<unsigned char*>(bytes);
  stream.avail_in = static_cast<unsigned>(size);
  std::size_t lastBlock = 0;  // the bit where its header begins
  std::size_t end = 0;        // the bit behind it
  const auto position = [&] {
    return 8 * (size - stream.avail_in) - static_cast<std::size_t>(stream.data_type & kUnusedBits);
  };
  for (int result = Z_OK; result != Z_STREAM_END;) {
    if (stream.avail_out == 0) {
      stream.next_out = _decoder->output.data();
      stream.avail_out = static_cast<unsigned>(_decoder->output.size());
    }
    result = ::inflate(&stream, Z_BLOCK);
    if (result != Z_OK && result != Z_STREAM_END) return 0;
    if ((stream.data_type & kBetweenBlocks) == 0) continue;
    ((stream.data_type & kLastBlock) != 0 ? end : lastBlock) = position();
  }
  if (stream.total_out != content || stream.avail_in > 0 || end <= lastBlock) return 0;
  const auto keepBits = [bytes](std::size_t at, unsigned mask) {
    bytes[at] = static_cast<char>(bytes[at] & static_cast<int>(mask));
  };
  keepBits(lastBlock / 8, ~(1U << lastBlock % 8));
  // An empty stored block: three bits of zero, whatever is left of that byte, and its length twice.
  const std::size_t free = 8 * size - end;
  keepBits(size - 1, 0xFFU >> free);
  if (free < 3) bytes[size++] = 0;
  for (const unsigned byte : {0x00U, 0x00U, 0xFFU, 0xFFU}) bytes[size++] = static_cast<char>(byte);
  return size;
}

}  // namespace zal
