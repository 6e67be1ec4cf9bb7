#include "platform/linux/archive/chunk_compressor.h"

#include <isa-l.h>
#include <libdeflate.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <new>

#include "platform/linux/archive/deflate_continuation.h"

namespace zal {
namespace {

// Measured over a dump's kind of files: one less throughout makes archives larger than the usual tools do,
// but what leaves much anyway (captures, tables) gains next to nothing by the last level.
constexpr int kSmallLevel = 6, kSmallLevelOfStubborn = 5;
constexpr double kStubbornShare = 0.4;
// And of the fast levels, the second leaves such files no larger than the third does, sooner.
constexpr int kFastLevel = 3, kFastLevelOfStubborn = 2;
constexpr double kFastStubbornShare = 0.3;
constexpr int kTrialLevel = 1;
constexpr std::size_t kLongestStored = 65535;

std::uint8_t* bytesOf(const char* text) {
  return reinterpret_cast<std::uint8_t*>(const_cast<char*>(text));  // the library reads only
}

/// One call, one whole stream or piece. Returned: its size, 0 when it did not fit.
std::size_t deflateAtOnce(isal_zstream& stream, int level, std::uint8_t* workspace, std::size_t workspaceSize,
                          const char* input, std::size_t size, bool last, char* output,
                          std::size_t capacity) {
  ::isal_deflate_init(&stream);
  stream.level = static_cast<std::uint32_t>(level);
  stream.level_buf = workspace;
  stream.level_buf_size = static_cast<std::uint32_t>(workspaceSize);
  stream.end_of_stream = last ? 1 : 0;
  stream.flush = last ? NO_FLUSH : FULL_FLUSH;
  stream.next_in = bytesOf(input);
  stream.avail_in = static_cast<std::uint32_t>(size);
  stream.next_out = bytesOf(output);
  stream.avail_out = static_cast<std::uint32_t>(capacity);
  if (::isal_deflate(&stream) != COMP_OK || stream.avail_in > 0) return 0;
  // A full output may hide that something is still to come.
  return stream.avail_out > 0 ? stream.total_out : 0;
}

class FastCompressor : public ChunkCompressor {
 public:
  std::size_t compress(const Chunk& chunk, char* output, std::size_t capacity) override {
    const int level = chunk.share > kFastStubbornShare ? kFastLevelOfStubborn : kFastLevel;
    return deflateAtOnce(_stream, level, _workspace.data(), _workspace.size(), chunk.bytes, chunk.size,
                         chunk.last, output, capacity);
  }

 private:
  isal_zstream _stream;
  std::array<std::uint8_t, ISAL_DEF_LVL3_DEFAULT> _workspace;
};

using Compressor = std::unique_ptr<libdeflate_compressor, void (*)(libdeflate_compressor*)>;

Compressor makeCompressor(int level) {
  Compressor compressor(::libdeflate_alloc_compressor(level), &::libdeflate_free_compressor);
  if (!compressor) throw std::bad_alloc();
  return compressor;
}

class SmallCompressor : public ChunkCompressor {
 public:
  std::size_t compress(const Chunk& chunk, char* output, std::size_t capacity) override {
    if (capacity <= kContinuationRoom) return 0;
    const Compressor& compressor = chunk.share > kStubbornShare ? _ofStubborn : _usual;
    const std::size_t written = ::libdeflate_deflate_compress(compressor.get(), chunk.bytes, chunk.size,
                                                              output, capacity - kContinuationRoom);
    // The library knows whole streams only.
    return chunk.last || written == 0 ? written : _continuation.letAnotherFollow(output, written, chunk.size);
  }

 private:
  const Compressor _usual = makeCompressor(kSmallLevel);
  const Compressor _ofStubborn = makeCompressor(kSmallLevelOfStubborn);
  DeflateContinuation _continuation;
};

}  // namespace

std::unique_ptr<ChunkCompressor> makeChunkCompressor(ArchiveCompression compression) {
  if (compression == ArchiveCompression::small) return std::make_unique<SmallCompressor>();
  return std::make_unique<FastCompressor>();
}

struct CompressionTrial::Workspace {
  isal_zstream stream;
  std::array<std::uint8_t, ISAL_DEF_LVL1_SMALL> level;
  std::array<char, kSample> output;
};

CompressionTrial::CompressionTrial() : _workspace(std::make_unique<Workspace>()) {}
CompressionTrial::~CompressionTrial() = default;

double CompressionTrial::share(const char* sample, std::size_t size) {
  const std::size_t left =
      deflateAtOnce(_workspace->stream, kTrialLevel, _workspace->level.data(), _workspace->level.size(),
                    sample, size, true, _workspace->output.data(), size);
  return left > 0 ? static_cast<double>(left) / static_cast<double>(size) : 1;
}

double CompressionTrial::chunkShare(const char* chunk, std::size_t size) {
  if (size < 8 * kSample) return 0;
  return (share(chunk + size / 4, kSample) + share(chunk + size / 4 * 3, kSample)) / 2;
}

std::size_t storeChunk(const char* chunk, std::size_t size, bool last, char* output) {
  char* const begin = output;
  do {
    const std::size_t part = std::min(size, kLongestStored);
    *output++ = last && part == size ? 1 : 0;
    for (const std::size_t length : {part, ~part}) {
      *output++ = static_cast<char>(length);
      *output++ = static_cast<char>(length >> 8U);
    }
    std::memcpy(output, chunk, part);
    output += part;
    chunk += part;
    size -= part;
  } while (size > 0);
  return static_cast<std::size_t>(output - begin);
}

}  // namespace zal
